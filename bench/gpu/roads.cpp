// SPDX-License-Identifier: Apache-2.0
// The body of every benchmark: make, check, time.
#include "roads.hpp"

#include <algorithm>
#include <cstdio>
#include <memory>
#include <stdexcept>
#include <string>
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

// What the repetitions of one road know of each other.
struct road_state {
  bool checked = false;
  std::string failure;
};

bool any_failed = false;

void run(benchmark::State& state, const road& way, road_state& known) {
  if (!known.failure.empty()) {
    state.SkipWithError(known.failure.c_str());
    return;
  }
  const auto n = static_cast<std::int64_t>(way.n);
  try {
    const std::unique_ptr<filler> made = way.make();
    if (!known.checked)
      check_road(way, *made);
    known.checked = true;
    for (auto _ : state) {
      const timing timed = time_calls(*made, static_cast<int>(values_behind_each_other / n));
      state.SetIterationTime(timed.device);
      state.counters[wall_counter] = timed.wall;
    }
    state.SetItemsProcessed(n);
    state.SetBytesProcessed(n * static_cast<std::int64_t>(way.value_bytes));
  } catch (const std::exception& error) {
    known.failure = error.what();
    any_failed = true;
    // Here, since the table shows what the other repetitions made of it.
    std::fprintf(stderr, "%s: %s\n", way.name.c_str(), error.what());
    state.SkipWithError(error.what());
  }
}

}  // namespace

bool any_road_failed() {
  return any_failed;
}

void add_road(const road& added) {
  const auto known = std::make_shared<road_state>();
  auto* registered = benchmark::RegisterBenchmark(
      added.name.c_str(), [added, known](benchmark::State& state) { run(state, added, *known); });
  registered->UseManualTime()->Iterations(1)->Repetitions(repetitions);
  take_quartiles(registered);
}

}  // namespace gpu_bench
