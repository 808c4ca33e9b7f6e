// SPDX-License-Identifier: Apache-2.0
// What a word costs through bit_generator: read alone, and under std::shuffle and a standard
// distribution, beside std::mt19937.
#include <algorithm>
#include <cstdint>
#include <numeric>
#include <random>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"

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

void add(const std::string& name, void (*run)(benchmark::State&)) {
  benchmark::RegisterBenchmark(name.c_str(), run)
      ->Repetitions(5)
      ->MinTime(0.1)
      ->ReportAggregatesOnly();
}

template <typename Source>
void add_source(const std::string& name) {
  add(name + "/read", read<Source>);
  add(name + "/shuffle", shuffle<Source>);
  add(name + "/normal", normal<Source>);
}

}  // namespace

int main(int argc, char** argv) {
  add_source<viewed<rng::philox4x32x10>>("philox4x32x10");
  add_source<viewed<rng::mt19937>>("mt19937");
  add_source<plain<std::mt19937>>("std_mt19937");
  add("philox4x32x10/one_word", one_word<rng::philox4x32x10>);
  add("mt19937/one_word", one_word<rng::mt19937>);
  if (!initialize(argc, argv)) {
    return 1;
  }
  std::vector<quotient> quotients;
  for (const std::string engine : {"philox4x32x10/", "mt19937/"}) {
    for (const std::string use : {"read", "shuffle", "normal"}) {
      quotients.push_back({engine + use, {"std_mt19937/" + use}});
    }
  }
  announce_quotients("views", quotients);
  benchmark::RunSpecifiedBenchmarks();
}
