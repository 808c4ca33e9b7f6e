// SPDX-License-Identifier: Apache-2.0
// Routines of the host statistics library on philox4x32x10 and one thread, 4 million values, beside
// what a user would take instead, in one run; short calls; and what a second thread adds.
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"
#include "distribution_peers.hpp"
#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace {

constexpr std::int64_t count = 4'000'000;
constexpr std::int64_t short_count = 16;
constexpr int repetitions = 9;

rvx_stream stream = nullptr;

void check(int status) {
  if (status != 0) {
    std::fprintf(stderr, "a routine failed with status %d\n", status);
    std::exit(1);
  }
}

// A routine with its parameters: draws n values.
template <class Value>
struct routine {
  const char* name;
  int (*draw)(std::int64_t n, Value* r);
  bool fixed_words;  // shared out among threads
};

const std::vector<routine<float>> float_routines = {
    {"uniform_float",
     [](std::int64_t n, float* r) { return rvxsRngUniform(0, stream, n, r, 0, 1); }, true},
    {"gaussian_float_icdf",
     [](std::int64_t n, float* r) {
       return rvxsRngGaussian(RVX_RNG_METHOD_GAUSSIAN_ICDF, stream, n, r, 0, 1);
     },
     true},
    {"gaussian_float_box_muller2",
     [](std::int64_t n, float* r) {
       return rvxsRngGaussian(RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2, stream, n, r, 0, 1);
     },
     true},
    {"exponential",
     [](std::int64_t n, float* r) { return rvxsRngExponential(0, stream, n, r, 0, 1); }, true},
    {"rayleigh", [](std::int64_t n, float* r) { return rvxsRngRayleigh(0, stream, n, r, 0, 1); },
     true},
    {"weibull",
     [](std::int64_t n, float* r) { return rvxsRngWeibull(0, stream, n, r, 1.7f, 0, 1); }, true},
    {"gumbel", [](std::int64_t n, float* r) { return rvxsRngGumbel(0, stream, n, r, 0, 1); }, true},
    {"laplace", [](std::int64_t n, float* r) { return rvxsRngLaplace(0, stream, n, r, 0, 1); },
     true},
    {"cauchy", [](std::int64_t n, float* r) { return rvxsRngCauchy(0, stream, n, r, 0, 1); }, true},
};
const std::vector<routine<double>> double_routines = {
    {"uniform_double",
     [](std::int64_t n, double* r) { return rvxdRngUniform(0, stream, n, r, 0, 1); }, true},
    {"gaussian_double_icdf",
     [](std::int64_t n, double* r) {
       return rvxdRngGaussian(RVX_RNG_METHOD_GAUSSIAN_ICDF, stream, n, r, 0, 1);
     },
     true},
    {"gaussian_double_box_muller2",
     [](std::int64_t n, double* r) {
       return rvxdRngGaussian(RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2, stream, n, r, 0, 1);
     },
     true},
    {"lognormal_double",
     [](std::int64_t n, double* r) {
       return rvxdRngLognormal(RVX_RNG_METHOD_LOGNORMAL_ICDF, stream, n, r, 0, 1, 0, 1);
     },
     true},
    {"gamma", [](std::int64_t n, double* r) { return rvxdRngGamma(0, stream, n, r, 2.5, 0, 1); },
     false},
    {"beta", [](std::int64_t n, double* r) { return rvxdRngBeta(0, stream, n, r, 2.5, 1.5, 0, 1); },
     false},
};
const std::vector<routine<std::int32_t>> integer_routines = {
    {"poisson_icdf_10",
     [](std::int64_t n, std::int32_t* r) {
       return rvxiRngPoisson(RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF, stream, n, r, 10);
     },
     true},
    {"poisson_icdf_500",
     [](std::int64_t n, std::int32_t* r) {
       return rvxiRngPoisson(RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF, stream, n, r, 500);
     },
     true},
    {"poisson_ptpe_10",
     [](std::int64_t n, std::int32_t* r) {
       return rvxiRngPoisson(RVX_RNG_METHOD_POISSON_PTPE, stream, n, r, 10);
     },
     false},
    {"poisson_ptpe_500",
     [](std::int64_t n, std::int32_t* r) {
       return rvxiRngPoisson(RVX_RNG_METHOD_POISSON_PTPE, stream, n, r, 500);
     },
     false},
    {"binomial",
     [](std::int64_t n, std::int32_t* r) { return rvxiRngBinomial(0, stream, n, r, 100, 0.4); },
     false},
    {"hypergeometric",
     [](std::int64_t n, std::int32_t* r) {
       return rvxiRngHypergeometric(0, stream, n, r, 100, 30, 50);
     },
     false},
    {"negative_binomial",
     [](std::int64_t n, std::int32_t* r) { return rvxiRngNegbinomial(0, stream, n, r, 10, 0.4); },
     false},
};

// What each routine is asked to reach over the fastest of the peers.
const std::vector<quotient> goals = {
    {"uniform_float/tarn", {"uniform_float/random123"}, 2.5},
    {"uniform_double/tarn", {"uniform_double/random123"}, 2},
    {"gaussian_float_icdf/tarn", {"normal_float/boost"}, 5},
    {"gaussian_float_box_muller2/tarn", {"normal_float/boost"}, 5},
    {"gaussian_double_icdf/tarn", {"normal_double/boost"}, 4},
    {"gaussian_double_box_muller2/tarn", {"normal_double/boost"}, 4},
    {"exponential/tarn", {"exponential_float/boost"}, 4},
    {"rayleigh/tarn", {"exponential_float/boost"}, 4},
    {"weibull/tarn", {"exponential_float/boost"}, 4},
    {"gumbel/tarn", {"exponential_float/boost"}, 4},
    {"laplace/tarn", {"exponential_float/boost"}, 4},
    {"cauchy/tarn", {"exponential_float/boost"}, 4},
    {"lognormal_double/tarn", {"lognormal/numpy"}, 8},
    {"gamma/tarn", {"gamma/std", "gamma/gsl", "gamma/numpy"}, 4},
    {"beta/tarn", {"beta/gsl", "beta/numpy"}, 5},
    {"poisson_icdf_10/tarn",
     {"poisson_10/std", "poisson_10/boost", "poisson_10/gsl", "poisson_10/numpy"},
     15},
    {"poisson_icdf_500/tarn",
     {"poisson_500/std", "poisson_500/boost", "poisson_500/gsl", "poisson_500/numpy"},
     8},
    {"poisson_ptpe_10/tarn",
     {"poisson_10/std", "poisson_10/boost", "poisson_10/gsl", "poisson_10/numpy"},
     8},
    {"poisson_ptpe_500/tarn",
     {"poisson_500/std", "poisson_500/boost", "poisson_500/gsl", "poisson_500/numpy"},
     4},
    {"binomial/tarn", {"binomial/boost", "binomial/numpy"}, 6},
    {"hypergeometric/tarn", {"hypergeometric/numpy"}, 8},
    {"negative_binomial/tarn", {"negative_binomial/numpy"}, 10},
};
constexpr double two_threads = 1.7;
constexpr double short_call = 300;  // nanoseconds

benchmark::internal::Benchmark* add(const std::string& name,
                                    const std::function<void(benchmark::State&)>& run) {
  return benchmark::RegisterBenchmark(name.c_str(), run)
      ->Repetitions(repetitions)
      ->ReportAggregatesOnly();
}

// How a rate is measured: by the processor time of the calling thread, which other work on the
// machine disturbs least, or by the clock, which is what further threads can shorten.
enum class measure { thread_time, clock };

// draw(n, values) in a loop, on memory that was touched before.
template <class Value>
void add_draw(const std::string& name, std::int64_t n, int threads,
              const std::function<void(std::int64_t, Value*)>& draw,
              measure by = measure::thread_time) {
  auto* added = add(name, [n, threads, draw](benchmark::State& state) {
    tarn_serv_set_max_threads(threads);
    std::vector<Value> values(static_cast<std::size_t>(n));
    draw(n, values.data());
    for (auto _ : state) {
      draw(n, values.data());
      benchmark::ClobberMemory();
    }
    state.SetItemsProcessed(state.iterations() * n);
  });
  added->MinTime(n == count ? 0.1 : 0.02)
      ->Unit(n == count ? benchmark::kMillisecond : benchmark::kNanosecond);
  if (by == measure::clock)
    added->UseRealTime();
}

template <class Value, class Peer>
void add_all(const std::vector<routine<Value>>& routines, const std::vector<Peer>& others) {
  for (const routine<Value>& r : routines) {
    const auto draw = [r](std::int64_t n, Value* to) { check(r.draw(n, to)); };
    const std::string name = r.name;
    add_draw<Value>(name + "/tarn", count, 1, draw);
    if (r.fixed_words) {
      add_draw<Value>(name + "/1thread", count, 1, draw, measure::clock);
      add_draw<Value>(name + "/2threads", count, 2, draw, measure::clock);
      add_draw<Value>(name + "/short", short_count, 1, draw);
    }
  }
  for (const Peer& p : others)
    add_draw<Value>(p.name, count, 1,
                    [p](std::int64_t n, Value* to) { p.fill(static_cast<std::size_t>(n), to); });
}

template <class Value>
void compare_threads_and_short_calls(const std::vector<routine<Value>>& routines,
                                     std::vector<quotient>& threads,
                                     std::vector<time_limit>& short_calls) {
  for (const routine<Value>& r : routines) {
    if (!r.fixed_words)
      continue;
    const std::string name = r.name;
    threads.push_back({name + "/2threads", {name + "/1thread"}, two_threads});
    short_calls.push_back({name + "/short", short_call});
  }
}

void announce_tables() {
  announce_quotients("peers", goals);
  announce_rates(peers::numpy_rates());
  std::vector<quotient> threads;
  std::vector<time_limit> short_calls;
  compare_threads_and_short_calls(float_routines, threads, short_calls);
  compare_threads_and_short_calls(double_routines, threads, short_calls);
  compare_threads_and_short_calls(integer_routines, threads, short_calls);
  announce_quotients("threads", threads);
  announce_times("short", short_calls);
}

}  // namespace

int main(int argc, char** argv) {
  if (!initialize(argc, argv))
    return 1;
  check(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1));
  add_all(float_routines, peers::float_peers);
  add_all(double_routines, peers::double_peers);
  add_all(integer_routines, peers::integer_peers);

  announce_tables();
  benchmark::RunSpecifiedBenchmarks();
  check(rvxDeleteStream(&stream));
  return 0;
}
