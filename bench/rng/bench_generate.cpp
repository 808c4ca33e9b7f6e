// SPDX-License-Identifier: Apache-2.0
// generate on every device: what a whole call costs. Each row with a device road on philox4x32x10,
// from one result (the cost of the frame) to 4 million; and each engine with one, on the uniform
// distribution. Names read device/engine/distribution/n.
#include <cstdlib>
#include <cstring>
#include <initializer_list>
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
  if (n > 1) {
    state.SetItemsProcessed(state.iterations() * n);
    state.SetBytesProcessed(state.iterations() * n * static_cast<std::int64_t>(sizeof(T)));
  }
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
void register_call(const std::string& engine, const std::string& distr, const sycl::device& device,
                   std::initializer_list<std::int64_t> counts) {
  const std::string name = std::string(device.is_cpu() ? "cpu/" : "gpu/") + engine + "/" + distr;
  auto* registered = benchmark::RegisterBenchmark(
      name.c_str(), [device](benchmark::State& state) { draw<Engine, Distr>(state, device); });
  for (const std::int64_t n : counts) {
    registered->Arg(n);
  }
  registered->UseRealTime();
}

void register_rows(const sycl::device& device) {
  using namespace rng;
#define TARN_REGISTER(...)                                                         \
  register_call<philox4x32x10, __VA_ARGS__>("philox4x32x10", #__VA_ARGS__, device, \
                                            {1, 1000, 4000000});
#define TARN_REGISTER_generate(type) TARN_REGISTER type
#define TARN_REGISTER_generate_ex(type)  // bench_compound
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  TARN_IF_##gpu(TARN_REGISTER_##road(type))
#include "distributions/distributions.def"
}

void register_engines(const sycl::device& device) {
#define TARN_REGISTER_ENGINE(name) \
  register_call<rng::name, rng::uniform<>>(#name, "uniform<>", device, {4000000, 1 << 24});
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  TARN_IF_##gpu(TARN_REGISTER_ENGINE(name))
#include "engines/engines.def"
}

}  // namespace

int main(int argc, char** argv) {
  setenv("LUMEN_VIRTUAL_DEVICES", "gpu", 0);
  benchmark::RegisterBenchmark("memory_set", memory_set)->Arg(4000000)->Arg(1 << 24)->UseRealTime();
  for (const sycl::device& device : sycl::device::get_devices()) {
    register_rows(device);
    register_engines(device);
  }
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
}
