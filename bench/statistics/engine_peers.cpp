// SPDX-License-Identifier: Apache-2.0
// The loops of the peers.
#include "engine_peers.hpp"

#include <memory>
#include <random>

#include <boost/random/sobol.hpp>
#include <gsl/gsl_qrng.h>
#include <gsl/gsl_rng.h>
#include <Random123/philox.h>

namespace peers {

void random123_philox(std::size_t n, std::uint32_t* out) {
  const r123::Philox4x32 philox;
  const r123::Philox4x32::key_type key = {{1, 0}};
  for (std::size_t i = 0; i < n; i += 4) {
    const std::uint64_t c = i / 4;
    const r123::Philox4x32::ctr_type block = {
        {static_cast<std::uint32_t>(c), static_cast<std::uint32_t>(c >> 32), 0, 0}};
    const r123::Philox4x32::ctr_type words = philox(block, key);
    for (std::size_t j = 0; j < 4; ++j)
      out[i + j] = words[j];
  }
}

void std_mt19937(std::size_t n, std::uint32_t* out) {
  static std::mt19937 engine;
  for (std::size_t i = 0; i < n; ++i)
    out[i] = static_cast<std::uint32_t>(engine());
}

namespace {

struct free_generator {
  void operator()(gsl_rng* generator) const { gsl_rng_free(generator); }
  void operator()(gsl_qrng* generator) const { gsl_qrng_free(generator); }
};

void gsl_words(const gsl_rng_type* type, std::size_t n, std::uint32_t* out) {
  const std::unique_ptr<gsl_rng, free_generator> generator(gsl_rng_alloc(type));
  for (std::size_t i = 0; i < n; ++i)
    out[i] = static_cast<std::uint32_t>(gsl_rng_get(generator.get()));
}

}  // namespace

void gsl_r250(std::size_t n, std::uint32_t* out) {
  gsl_words(gsl_rng_r250, n, out);
}

void gsl_cmrg(std::size_t n, std::uint32_t* out) {
  gsl_words(gsl_rng_cmrg, n, out);
}

void gsl_niederreiter_12(std::size_t n, double* out) {
  const std::unique_ptr<gsl_qrng, free_generator> generator(
      gsl_qrng_alloc(gsl_qrng_niederreiter_2, 12));
  for (std::size_t i = 0; i < n; i += 12)
    gsl_qrng_get(generator.get(), out + i);
}

void boost_sobol_40(std::size_t n, std::uint32_t* out) {
  using generator = boost::random::sobol_engine<std::uint32_t, 32>;
  static generator engine(40);
  engine.seed(0);
  for (std::size_t i = 0; i < n; ++i)
    out[i] = engine();
}

}  // namespace peers
