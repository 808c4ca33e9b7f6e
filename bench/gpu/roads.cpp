// SPDX-License-Identifier: Apache-2.0
// The body of every benchmark: make, check, time.
#include "roads.hpp"

#include <algorithm>
#include <stdexcept>
#include <vector>

#include <benchmark/benchmark.h>

#include "cuda_fillers.hpp"
#include "figures.hpp"
#include "variates.hpp"

namespace gpu_bench {
namespace {

constexpr int repetitions = 21;

void check_road(const road& way, filler& filled_by) {
  const std::size_t bytes = way.n * way.value_bytes;
  check(cudaMemset(way.memory, unwritten, bytes));
  check(cudaDeviceSynchronize());  // no stream waits for the one of the line above
  filled_by.draw();
  filled_by.wait();
  std::vector<double> drawn(bytes / sizeof(double) + 1);  // aligned for every type
  check(cudaMemcpy(drawn.data(), way.memory, bytes, cudaMemcpyDeviceToHost));
  way.check(drawn.data());
}

void run(benchmark::State& state, const road& way, bool& checked) {
  const auto n = static_cast<std::int64_t>(way.n);
  try {
    const std::unique_ptr<filler> made = way.make();
    if (!checked)
      check_road(way, *made);
    checked = true;
    for (auto _ : state) {
      const timing timed = time_calls(*made, static_cast<int>(values_behind_each_other / n));
      state.SetIterationTime(timed.device);
      state.counters[wall_counter] = timed.wall;
    }
    state.SetItemsProcessed(n);
    state.SetBytesProcessed(n * static_cast<std::int64_t>(way.value_bytes));
  } catch (const std::exception& error) {
    state.SkipWithError(error.what());
  }
}

}  // namespace

void add_road(const road& added) {
  const auto checked = std::make_shared<bool>(false);
  auto* registered = benchmark::RegisterBenchmark(
      added.name.c_str(),
      [added, checked](benchmark::State& state) { run(state, added, *checked); });
  registered->UseManualTime()->Iterations(1)->Repetitions(repetitions);
  take_quartiles(registered);
}

}  // namespace gpu_bench
