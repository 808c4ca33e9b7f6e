// SPDX-License-Identifier: Apache-2.0
// generate over the rows with a device road, on every device: what a whole call costs, from one
// result (the cost of the frame) to 16 million. Names read device/engine/distribution/n.
#include <cstdlib>
#include <cstring>
#include <string>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <benchmark/benchmark.h>

#include "frame/rows.hpp"

namespace {

namespace rng = kestrel::tarn::rng;

template <typename Engine, typename Distr>
void draw(benchmark::State& state, const sycl::device& device) {
  using T = typename Distr::result_type;
  sycl::queue queue(device);
  Engine engine(queue);
  const Distr distr;
  const std::int64_t n = state.range(0);
  auto* values = sycl::malloc_shared<T>(static_cast<std::size_t>(n), queue);
  std::memset(static_cast<void*>(values), 1, static_cast<std::size_t>(n) * sizeof(T));
  for (auto _ : state) {
    rng::generate(distr, engine, n, values).wait();
    benchmark::ClobberMemory();
  }
  sycl::free(values, queue);
  state.SetItemsProcessed(state.iterations() * n);
  state.SetBytesProcessed(state.iterations() * n * static_cast<std::int64_t>(sizeof(T)));
}

/// The ceiling: how fast this memory takes anything at all.
void memory_set(benchmark::State& state) {
  const auto bytes = static_cast<std::size_t>(state.range(0)) * sizeof(float);
  void* memory = std::malloc(bytes);
  std::memset(memory, 1, bytes);
  for (auto _ : state) {
    std::memset(memory, 2, bytes);
    benchmark::ClobberMemory();
  }
  std::free(memory);
  state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(bytes));
}

template <typename Engine, typename Distr>
void register_row(const std::string& engine, const std::string& distr, const sycl::device& device) {
  const std::string name = std::string(device.is_cpu() ? "cpu/" : "gpu/") + engine + "/" + distr;
  benchmark::RegisterBenchmark(
      name.c_str(), [device](benchmark::State& state) { draw<Engine, Distr>(state, device); })
      ->Arg(1)
      ->Arg(1000)
      ->Arg(1 << 16)
      ->Arg(4000000)
      ->Arg(1 << 24)
      ->UseRealTime();
}

template <typename Engine>
void register_engine(const std::string& engine, const sycl::device& device) {
#define TARN_REGISTER(...) register_row<Engine, __VA_ARGS__>(engine, #__VA_ARGS__, device);
#define TARN_DISTRIBUTION(family, result, method, type, words, road, built) \
  TARN_IF_##built(TARN_REGISTER type)
  using namespace rng;
#include "distributions/distributions.def"
}

}  // namespace

int main(int argc, char** argv) {
  setenv("LUMEN_VIRTUAL_DEVICES", "gpu", 0);
  benchmark::RegisterBenchmark("memory_set", memory_set)->Arg(4000000)->Arg(1 << 24)->UseRealTime();
  for (const sycl::device& device : sycl::device::get_devices()) {
#define TARN_REGISTER_ENGINE(name) register_engine<rng::name>(#name, device);
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits, built)                                                     \
  TARN_IF_##built(TARN_REGISTER_ENGINE(name))
#include "engines/engines.def"
  }
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
}
