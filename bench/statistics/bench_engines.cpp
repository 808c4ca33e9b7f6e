// SPDX-License-Identifier: Apache-2.0
// Raw words of every engine of the host statistics library on one thread, beside what a user would
// take instead, in one run; the cost of a long skip and of making a stream. By the processor time
// of the thread, which other work on the machine disturbs least.
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"
#include "engine_peers.hpp"
#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace {

// A multiple of 4 and 12, for peers that give whole blocks and points.
constexpr std::size_t count = 4'000'008;
constexpr int repetitions = 9;

struct engine_row {
  std::string name;
  std::int64_t code;
  std::size_t parts;  // 32-bit numbers of a word
  bool skip;
};

const engine_row engines[] = {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  {#name, code, (word_bits + 31) / 32, skip != 0},
#include "rng/engines/engines.def"
};

// What each engine is asked to reach, and beside whom.
const std::vector<quotient> word_goals = {
    {"philox4x32x10/words", {"random123_philox/words"}, 2.5},
    {"ars5/words", {"random123_ars5/words"}, 1.5},
    {"mt19937/words", {"std_mt19937/words"}, 5},
    {"mt2203/words", {"std_mt19937/words"}, 5},
    {"sfmt19937/words", {"std_mt19937/words"}, 6},
    {"r250/words", {"gsl_r250/words"}, 6},
    {"mcg31m1/words", {"std_mt19937/words"}, 6},
    {"mcg59/words", {"std_mt19937/words"}, 6},
    {"mrg32k3a/words", {"gsl_cmrg/words"}, 5},
    {"wichmann_hill/words", {"gsl_cmrg/words"}, 3},
    {"sobol/words", {"boost_sobol_40/words"}, 4},
    {"niederreiter/words", {"gsl_niederreiter_12/words"}, 4},
};
const std::vector<time_limit> time_goals = {
    {"philox4x32x10/skip", 100}, {"ars5/skip", 100},           {"mcg31m1/skip", 2000},
    {"mcg59/skip", 2000},        {"wichmann_hill/skip", 2000}, {"mrg32k3a/skip", 2000},
    {"mt19937/skip", 5e6},       {"sfmt19937/skip", 5e6},      {"mt19937/make", 5000},
    {"mt2203/make", 5000},       {"sfmt19937/make", 5000},     {"philox4x32x10/make", 200},
    {"ars5/make", 200},
};

void check(int status) {
  if (status != 0) {
    std::fprintf(stderr, "a call failed with status %d\n", status);
    std::exit(1);
  }
}

rvx_stream new_stream(const engine_row& engine) {
  const std::uint64_t seed = engine.name == "sobol" ? 40 : engine.name == "niederreiter" ? 12 : 1;
  rvx_stream stream = nullptr;
  check(rvxNewStream(&stream, engine.code, seed));
  return stream;
}

benchmark::internal::Benchmark* add(const std::string& name,
                                    const std::function<void(benchmark::State&)>& run) {
  return benchmark::RegisterBenchmark(name.c_str(), run)
      ->Repetitions(repetitions)
      ->ReportAggregatesOnly();
}

// fill(values) writes `count` values, each of `parts` numbers.
template <class Value>
void add_fill(const std::string& name, std::size_t parts, const std::function<void(Value*)>& fill) {
  add(name,
      [parts, fill](benchmark::State& state) {
        std::vector<Value> values(count * parts);
        fill(values.data());
        for (auto _ : state) {
          fill(values.data());
          benchmark::ClobberMemory();
        }
        state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(count));
      })
      ->MinTime(0.1)
      ->Unit(benchmark::kMillisecond);
}

void add_engine(const engine_row& engine) {
  rvx_stream stream = new_stream(engine);
  add_fill<std::uint32_t>(engine.name + "/words", engine.parts, [stream](std::uint32_t* out) {
    check(rvxiRngUniformBits(0, stream, count, out));
  });
  // Distances of 63 bits; a finite sequence is set back first.
  if (engine.skip && engine.name != "sobol" && engine.name != "niederreiter") {
    add(engine.name + "/skip", [stream](benchmark::State& state) {
      std::uint64_t distance = 0x7123456789ABCDEF;
      for (auto _ : state) {
        check(rvxSkipAheadStream(stream, static_cast<std::int64_t>(distance)));
        distance = (distance * 5 + 1) | std::uint64_t{1} << 62;
        distance &= 0x7FFFFFFFFFFFFFFF;
      }
    })->MinTime(0.05);
  }
  add(engine.name + "/make", [engine](benchmark::State& state) {
    for (auto _ : state) {
      rvx_stream made = new_stream(engine);
      check(rvxDeleteStream(&made));
    }
  })->MinTime(0.02);
}

void add_peers() {
  using fill_words = void (*)(std::size_t, std::uint32_t*);
  const std::pair<const char*, fill_words> word_peers[] = {
      {"random123_philox/words", peers::random123_philox},
      {"random123_ars5/words", peers::random123_ars5},
      {"std_mt19937/words", peers::std_mt19937},
      {"gsl_r250/words", peers::gsl_r250},
      {"gsl_cmrg/words", peers::gsl_cmrg},
      {"boost_sobol_40/words", peers::boost_sobol_40},
  };
  for (const auto& [name, fill] : word_peers) {
    // A processor without AES cannot run that peer.
    if (fill == peers::random123_ars5 && !__builtin_cpu_supports("aes"))
      continue;
    add_fill<std::uint32_t>(name, 1, [fill = fill](std::uint32_t* out) { fill(count, out); });
  }
  add_fill<double>("gsl_niederreiter_12/words", 1,
                   [](double* out) { peers::gsl_niederreiter_12(count, out); });
}

}  // namespace

int main(int argc, char** argv) {
  __builtin_cpu_init();
  if (!initialize(argc, argv))
    return 1;
  tarn_serv_set_max_threads(1);
  for (const engine_row& engine : engines)
    add_engine(engine);
  add_peers();

  announce_quotients("words", word_goals);
  announce_times("streams", time_goals);
  benchmark::RunSpecifiedBenchmarks();
  return 0;
}
