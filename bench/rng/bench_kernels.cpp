// SPDX-License-Identifier: Apache-2.0
// The virtual GPU against a plain loop over the same stepping header, compiled with the same flags:
// what the frame of kernels, launches and work-items costs. Its rate should be at least 0.8 of the
// loop's, times the number of threads; where the processors share their cores, the loop on as many
// threads says what that number is worth.
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"
#include "engines/mcg31m1.hpp"
#include "engines/mcg59.hpp"
#include "engines/philox4x32x10.hpp"
#include "frame/engine_func.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace detail = kestrel::tarn::rng::detail;

constexpr std::int64_t count = 1 << 24;
constexpr double least_share = 0.8;

/// One work-item after the other, on each thread.
template <typename Engine>
void plain_loop(benchmark::State& state) {
  using traits = detail::engine_traits<Engine>;
  typename traits::record start{};
  std::memset(&start, 1, sizeof start);
  if constexpr (std::is_same_v<Engine, rng::philox4x32x10>) {
    start.idx = 0;
  }
  const auto rule = traits::rule(detail::gpu::real_range<float>{0.0f, 1.0f});
  std::vector<float> values(count, 1.0f);
  float* out = values.data();
  benchmark::DoNotOptimize(start);  // what a kernel gets is not known when it is compiled either
  for (auto _ : state) {
    for (std::uint64_t g = 0; g < count / 4; ++g) {
      typename traits::record position = start;
      sycl::vec<float, 4> block;
      traits::template four<detail::gpu::drawn::reals>(&position, g, block, rule);
      detail::store_values(out, 4 * g, count, block);
    }
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * count);
}

template <typename Engine>
void virtual_gpu(benchmark::State& state) {
  sycl::queue queue(sycl::gpu_selector_v);
  Engine engine(queue);
  std::vector<float> values(count, 1.0f);
  for (auto _ : state) {
    rng::generate(rng::uniform<float>(), engine, count, values.data()).wait();
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * count);
}

const int threads = static_cast<int>(std::thread::hardware_concurrency());

std::vector<quotient> quotients;

template <typename Engine>
void register_engine(const std::string& name) {
  const auto add = [](const std::string& what, void (*run)(benchmark::State&)) {
    return benchmark::RegisterBenchmark(what.c_str(), run)->UseRealTime()->Repetitions(5);
  };
  add(name + "/loop", plain_loop<Engine>);
  add(name + "/loops", plain_loop<Engine>)->Threads(threads);
  add(name + "/virtual_gpu", virtual_gpu<Engine>);
  quotients.push_back({name + "/virtual_gpu", {name + "/loop"}, least_share * threads});
  quotients.push_back({name + "/virtual_gpu", {name + "/loops"}, least_share});
}

}  // namespace

int main(int argc, char** argv) {
  setenv("LUMEN_VIRTUAL_DEVICES", "gpu", 0);
  register_engine<rng::philox4x32x10>("philox4x32x10");
  register_engine<rng::mcg31m1>("mcg31m1");
  register_engine<rng::mcg59>("mcg59");
  if (!initialize(argc, argv)) {
    return 1;
  }
  announce_quotients("kernels", quotients);
  benchmark::RunSpecifiedBenchmarks();
}
