// SPDX-License-Identifier: Apache-2.0
// The loops of the peers. Generators are those that each library is commonly used with.
#include "distribution_peers.hpp"

#include <cstdio>
#include <memory>
#include <random>

#include <boost/random/binomial_distribution.hpp>
#include <boost/random/exponential_distribution.hpp>
#include <boost/random/mersenne_twister.hpp>
#include <boost/random/normal_distribution.hpp>
#include <boost/random/poisson_distribution.hpp>
#include <boost/random/uniform_real_distribution.hpp>
#include <gsl/gsl_randist.h>
#include <gsl/gsl_rng.h>
#include <Random123/philox.h>
#include <Random123/uniform.hpp>

namespace peers {

namespace {

template <class Value, class Draw>
void loop(std::size_t n, Value* out, const Draw& draw) {
  for (std::size_t i = 0; i < n; ++i)
    out[i] = draw();
}

// n is a multiple of four.
template <class Value>
void random123_uniform(std::size_t n, Value* out) {
  const r123::Philox4x32 philox;
  const r123::Philox4x32::key_type key = {{1, 0}};
  for (std::size_t i = 0; i < n; i += 4) {
    const r123::Philox4x32::ctr_type block = {{static_cast<std::uint32_t>(i / 4), 0, 0, 0}};
    const r123::Philox4x32::ctr_type words = philox(block, key);
    for (std::size_t j = 0; j < 4; ++j)
      out[i + j] = r123::u01<Value>(words[j]);
  }
}

boost::random::mt19937 boost_engine;
std::mt19937 std_engine;

void boost_uniform(std::size_t n, double* out) {
  boost::random::uniform_real_distribution<double> uniform;
  loop(n, out, [&] { return uniform(boost_engine); });
}
void std_uniform(std::size_t n, double* out) {
  std::uniform_real_distribution<double> uniform;
  loop(n, out, [&] { return uniform(std_engine); });
}
void std_normal(std::size_t n, double* out) {
  std::normal_distribution<double> normal;
  loop(n, out, [&] { return normal(std_engine); });
}
template <class Value>
void boost_normal(std::size_t n, Value* out) {
  boost::random::normal_distribution<Value> normal;
  loop(n, out, [&] { return normal(boost_engine); });
}
void boost_exponential(std::size_t n, float* out) {
  boost::random::exponential_distribution<float> exponential;
  loop(n, out, [&] { return exponential(boost_engine); });
}
void std_gamma(std::size_t n, double* out) {
  std::gamma_distribution<double> gamma(2.5);
  loop(n, out, [&] { return gamma(std_engine); });
}
template <int Rate>
void std_poisson(std::size_t n, std::int32_t* out) {
  std::poisson_distribution<std::int32_t> poisson(Rate);
  loop(n, out, [&] { return poisson(std_engine); });
}
template <int Rate>
void boost_poisson(std::size_t n, std::int32_t* out) {
  boost::random::poisson_distribution<std::int32_t> poisson(Rate);
  loop(n, out, [&] { return poisson(boost_engine); });
}
void boost_binomial(std::size_t n, std::int32_t* out) {
  boost::random::binomial_distribution<std::int32_t> binomial(100, 0.4);
  loop(n, out, [&] { return binomial(boost_engine); });
}

struct free_generator {
  void operator()(gsl_rng* generator) const { gsl_rng_free(generator); }
};
const gsl_rng* gsl_engine() {
  static const std::unique_ptr<gsl_rng, free_generator> engine(gsl_rng_alloc(gsl_rng_mt19937));
  return engine.get();
}
void gsl_uniform(std::size_t n, double* out) {
  loop(n, out, [] { return gsl_rng_uniform(gsl_engine()); });
}
// Its ziggurat, the one of its methods that is meant to be fast.
void gsl_normal(std::size_t n, double* out) {
  loop(n, out, [] { return gsl_ran_gaussian_ziggurat(gsl_engine(), 1); });
}
void gsl_gamma(std::size_t n, double* out) {
  loop(n, out, [] { return gsl_ran_gamma(gsl_engine(), 2.5, 1); });
}
void gsl_beta(std::size_t n, double* out) {
  loop(n, out, [] { return gsl_ran_beta(gsl_engine(), 2.5, 1.5); });
}
template <int Rate>
void gsl_poisson(std::size_t n, std::int32_t* out) {
  loop(n, out, [] { return static_cast<std::int32_t>(gsl_ran_poisson(gsl_engine(), Rate)); });
}

}  // namespace

const std::vector<peer<fill_floats>> float_peers = {
    {"uniform_float/random123", random123_uniform<float>},
    {"normal_float/boost", boost_normal<float>},
    {"exponential_float/boost", boost_exponential},
};
const std::vector<peer<fill_doubles>> double_peers = {
    {"uniform_double/random123", random123_uniform<double>},
    {"normal_double/boost", boost_normal<double>},
    {"gamma/std", std_gamma},
    {"gamma/gsl", gsl_gamma},
    {"beta/gsl", gsl_beta},
};
const std::vector<peer<fill_doubles>> speed_peers = {
    {"uniform/std", std_uniform},     {"uniform/gsl", gsl_uniform},
    {"uniform/boost", boost_uniform}, {"gaussian/std", std_normal},
    {"gaussian/gsl", gsl_normal},     {"gaussian/boost", boost_normal<double>},
};
const std::vector<peer<fill_integers>> integer_peers = {
    {"poisson_10/std", std_poisson<10>},     {"poisson_500/std", std_poisson<500>},
    {"poisson_10/boost", boost_poisson<10>}, {"poisson_500/boost", boost_poisson<500>},
    {"poisson_10/gsl", gsl_poisson<10>},     {"poisson_500/gsl", gsl_poisson<500>},
    {"binomial/boost", boost_binomial},
};

// The median of nine calls of four million values each, of the faster of NumPy's two usual
// generators, in CPU time of the thread, as ours is. Where NumPy fills an array of the caller's it
// does (out=); its other distributions can only make one, which their time has in it.
std::vector<foreign_rate> numpy_rates() {
  static const char script[] =
      "import time, statistics\n"
      "try:\n"
      "  import numpy\n"
      "except ImportError:\n"
      "  raise SystemExit\n"
      "calls = {\n"
      "  'lognormal': lambda g, r: g.lognormal(0, 1, r.size),\n"
      "  'gamma': lambda g, r: g.standard_gamma(2.5, out=r),\n"
      "  'beta': lambda g, r: g.beta(2.5, 1.5, r.size),\n"
      "  'poisson_10': lambda g, r: g.poisson(10, r.size),\n"
      "  'poisson_500': lambda g, r: g.poisson(500, r.size),\n"
      "  'binomial': lambda g, r: g.binomial(100, 0.4, r.size),\n"
      "  'hypergeometric': lambda g, r: g.hypergeometric(50, 50, 30, r.size),\n"
      "  'negative_binomial': lambda g, r: g.negative_binomial(10, 0.4, r.size),\n"
      "}\n"
      "results = numpy.zeros(4000000)\n"
      "for name, call in calls.items():\n"
      "  best = 0\n"
      "  for kind in (numpy.random.PCG64, numpy.random.MT19937):\n"
      "    g = numpy.random.Generator(kind(1))\n"
      "    call(g, results)\n"
      "    times = []\n"
      "    for _ in range(9):\n"
      "      start = time.thread_time()\n"
      "      call(g, results)\n"
      "      times.append(time.thread_time() - start)\n"
      "    best = max(best, results.size / statistics.median(times))\n"
      "  print(name, best)\n";
  std::vector<foreign_rate> rates;
  const std::string command =
      std::string("/usr/bin/python3 - <<'END' 2>/dev/null\n") + script + "END";
  std::FILE* output = popen(command.c_str(), "r");
  if (output == nullptr)
    return rates;
  char name[64];
  double rate = 0;
  while (std::fscanf(output, "%63s %lf", name, &rate) == 2)
    rates.push_back({std::string(name) + "/numpy", rate});
  pclose(output);
  return rates;
}

}  // namespace peers
