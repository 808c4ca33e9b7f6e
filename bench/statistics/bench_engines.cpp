// SPDX-License-Identifier: Apache-2.0
// Raw words of every engine of the host statistics library on one thread, beside what a user would
// take instead, in one run; the cost of a long skip and of making a stream. Prints the quotients of
// the medians at the end.
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "engine_peers.hpp"
#include "ratios.hpp"
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
struct goal {
  const char *engine, *peer;
  double ratio;
};
constexpr goal word_goals[] = {
    {"philox4x32x10", "random123_philox", 2.5},
    {"ars5", "random123_ars5", 1.5},
    {"mt19937", "std_mt19937", 5},
    {"mt2203", "std_mt19937", 5},
    {"sfmt19937", "std_mt19937", 6},
    {"r250", "gsl_r250", 6},
    {"mcg31m1", "std_mt19937", 6},
    {"mcg59", "std_mt19937", 6},
    {"mrg32k3a", "gsl_cmrg", 5},
    {"wichmann_hill", "gsl_cmrg", 3},
    {"sobol", "boost_sobol_40", 4},
    {"niederreiter", "gsl_niederreiter_12", 4},
};
struct time_goal {
  const char* name;
  double nanoseconds;
};
constexpr time_goal time_goals[] = {
    {"skip/philox4x32x10", 100}, {"skip/ars5", 100},           {"skip/mcg31m1", 2000},
    {"skip/mcg59", 2000},        {"skip/wichmann_hill", 2000}, {"skip/mrg32k3a", 2000},
    {"skip/mt19937", 5e6},       {"skip/sfmt19937", 5e6},      {"make/mt19937", 5000},
    {"make/mt2203", 5000},       {"make/sfmt19937", 5000},     {"make/philox4x32x10", 200},
    {"make/ars5", 200},
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
      ->UseRealTime()
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
  add_fill<std::uint32_t>("words/" + engine.name, engine.parts, [stream](std::uint32_t* out) {
    check(rvxiRngUniformBits(0, stream, count, out));
  });
  // Distances of 63 bits; a finite sequence is set back first.
  if (engine.skip && engine.name != "sobol" && engine.name != "niederreiter") {
    add("skip/" + engine.name, [stream](benchmark::State& state) {
      std::uint64_t distance = 0x7123456789ABCDEF;
      for (auto _ : state) {
        check(rvxSkipAheadStream(stream, static_cast<std::int64_t>(distance)));
        distance = (distance * 5 + 1) | std::uint64_t{1} << 62;
        distance &= 0x7FFFFFFFFFFFFFFF;
      }
    })->MinTime(0.05);
  }
  add("make/" + engine.name, [engine](benchmark::State& state) {
    for (auto _ : state) {
      rvx_stream made = new_stream(engine);
      check(rvxDeleteStream(&made));
    }
  })->MinTime(0.02);
}

void add_peers() {
  using fill_words = void (*)(std::size_t, std::uint32_t*);
  const std::pair<const char*, fill_words> word_peers[] = {
      {"random123_philox", peers::random123_philox},
      {"random123_ars5", peers::random123_ars5},
      {"std_mt19937", peers::std_mt19937},
      {"gsl_r250", peers::gsl_r250},
      {"gsl_cmrg", peers::gsl_cmrg},
      {"boost_sobol_40", peers::boost_sobol_40},
  };
  for (const auto& [name, fill] : word_peers) {
    // A processor without AES cannot run that peer.
    if (fill == peers::random123_ars5 && !__builtin_cpu_supports("aes"))
      continue;
    add_fill<std::uint32_t>(name, 1, [fill = fill](std::uint32_t* out) { fill(count, out); });
  }
  add_fill<double>("gsl_niederreiter_12", 1,
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

  ratio_reporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  std::printf("\nQuotients of the median rates (words per second, one thread)\n");
  for (const goal& wanted : word_goals)
    reporter.print_ratio(std::string("words/") + wanted.engine, wanted.peer, wanted.ratio);
  std::printf("\nMedian times\n");
  for (const time_goal& wanted : time_goals)
    reporter.print_time(wanted.name, wanted.nanoseconds);
  return 0;
}
