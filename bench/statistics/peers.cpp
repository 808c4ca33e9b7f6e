// SPDX-License-Identifier: Apache-2.0
// The loops of the peers.
#include "peers.hpp"

#include <random>

#include <Random123/philox.h>
#include <Random123/uniform.hpp>

#if TARN_BENCH_BOOST
#include <boost/random/mersenne_twister.hpp>
#include <boost/random/uniform_real_distribution.hpp>
#endif

namespace peers {

namespace {

// n is a multiple of four.
template <class Value, class Convert>
void random123(std::uint64_t counter, std::size_t n, Value* out, const Convert& convert) {
  const r123::Philox4x32 philox;
  const r123::Philox4x32::key_type key = {{0, 0}};
  for (std::size_t i = 0; i < n; i += 4) {
    const std::uint64_t c = counter + i / 4;
    const r123::Philox4x32::ctr_type block = {
        {static_cast<std::uint32_t>(c), static_cast<std::uint32_t>(c >> 32), 0, 0}};
    const r123::Philox4x32::ctr_type words = philox(block, key);
    for (std::size_t j = 0; j < 4; ++j)
      out[i + j] = convert(words[j]);
  }
}

template <class Engine, class Value>
void engine_words(Engine& engine, std::size_t n, Value* out) {
  for (std::size_t i = 0; i < n; ++i)
    out[i] = static_cast<Value>(engine());
}

template <class Engine, class Distribution, class Value>
void engine_reals(Engine& engine, Distribution distribution, std::size_t n, Value* out) {
  for (std::size_t i = 0; i < n; ++i)
    out[i] = distribution(engine);
}

std::mt19937 std_engine;

}  // namespace

void random123_words(std::uint64_t counter, std::size_t n, std::uint32_t* out) {
  random123(counter, n, out, [](std::uint32_t word) { return word; });
}
void random123_floats(std::uint64_t counter, std::size_t n, float* out) {
  random123(counter, n, out, [](std::uint32_t word) { return r123::u01<float>(word); });
}
void random123_doubles(std::uint64_t counter, std::size_t n, double* out) {
  random123(counter, n, out, [](std::uint32_t word) { return r123::u01<double>(word); });
}

void std_words(std::size_t n, std::uint32_t* out) {
  engine_words(std_engine, n, out);
}
void std_floats(std::size_t n, float* out) {
  engine_reals(std_engine, std::uniform_real_distribution<float>(), n, out);
}
void std_doubles(std::size_t n, double* out) {
  engine_reals(std_engine, std::uniform_real_distribution<double>(), n, out);
}

#if TARN_BENCH_BOOST
namespace {
boost::random::mt19937 boost_engine;
}
void boost_words(std::size_t n, std::uint32_t* out) {
  engine_words(boost_engine, n, out);
}
void boost_floats(std::size_t n, float* out) {
  engine_reals(boost_engine, boost::random::uniform_real_distribution<float>(), n, out);
}
void boost_doubles(std::size_t n, double* out) {
  engine_reals(boost_engine, boost::random::uniform_real_distribution<double>(), n, out);
}
#endif

}  // namespace peers
