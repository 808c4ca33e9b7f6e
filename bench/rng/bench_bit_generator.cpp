// SPDX-License-Identifier: Apache-2.0
// What a word costs through bit_generator: read alone, and under std::shuffle and a standard
// distribution, beside std::mt19937. Names read generator/use.
#include <algorithm>
#include <cstdint>
#include <numeric>
#include <random>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <benchmark/benchmark.h>

namespace {

namespace rng = kestrel::tarn::rng;

constexpr std::int64_t words = 1 << 16;

/// An engine with its view.
template <typename Engine>
struct viewed {
  Engine engine{sycl::queue(sycl::cpu_selector_v)};
  rng::bit_generator<Engine> generator{engine};
};
/// A generator of the standard library.
template <typename Generator>
struct plain {
  Generator generator;
};

template <typename Source>
void read(benchmark::State& state) {
  Source source;
  for (auto _ : state) {
    std::uint32_t sum = 0;
    for (std::int64_t i = 0; i < words; ++i) {
      sum ^= static_cast<std::uint32_t>(source.generator());
    }
    benchmark::DoNotOptimize(sum);
  }
  state.SetItemsProcessed(state.iterations() * words);
}

template <typename Source>
void shuffle(benchmark::State& state) {
  Source source;
  std::vector<std::uint32_t> values(words);
  std::iota(values.begin(), values.end(), 0u);
  for (auto _ : state) {
    std::shuffle(values.begin(), values.end(), source.generator);
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * words);
}

template <typename Source>
void normal(benchmark::State& state) {
  Source source;
  std::normal_distribution<double> distribution;
  for (auto _ : state) {
    double sum = 0.0;
    for (std::int64_t i = 0; i < words; ++i) {
      sum += distribution(source.generator);
    }
    benchmark::DoNotOptimize(sum);
  }
  state.SetItemsProcessed(state.iterations() * words);
}

/// The cost of a view by itself: one word, then the block is given back.
template <typename Engine>
void one_word(benchmark::State& state) {
  Engine engine{sycl::queue(sycl::cpu_selector_v)};
  for (auto _ : state) {
    benchmark::DoNotOptimize(rng::bit_generator<Engine>(engine)());
  }
}

template <typename Source>
void register_source(const std::string& name) {
  benchmark::RegisterBenchmark((name + "/read").c_str(), read<Source>);
  benchmark::RegisterBenchmark((name + "/shuffle").c_str(), shuffle<Source>);
  benchmark::RegisterBenchmark((name + "/normal").c_str(), normal<Source>);
}

}  // namespace

int main(int argc, char** argv) {
  register_source<viewed<rng::philox4x32x10>>("philox4x32x10");
  register_source<viewed<rng::mt19937>>("mt19937");
  register_source<plain<std::mt19937>>("std::mt19937");
  benchmark::RegisterBenchmark("philox4x32x10/one_word", one_word<rng::philox4x32x10>);
  benchmark::RegisterBenchmark("mt19937/one_word", one_word<rng::mt19937>);
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
}
