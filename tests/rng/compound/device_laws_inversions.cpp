// SPDX-License-Identifier: Apache-2.0
// The discrete distributions on a GPU queue that make a result of one word: poisson in its three
// regimes, geometric, bernoulli.
#include "device_laws.hpp"

namespace {

using namespace tarn_test;

template <typename Engine>
class inversion_laws : public device_laws<Engine> {};
TYPED_TEST_SUITE(inversion_laws, engines_of_laws, name_of_engine);

// Rates on both sides of 1 and of 100, in each of the rows of coefficients between them.
TYPED_TEST(inversion_laws, of_poisson_hold) {
  for (const double rate : {1e-3, 0.06, 0.5,  0.99, 1.0,  1.5,   2.0,   3.9,    4.0, 7.5,
                            10.0, 27.0, 33.0, 64.0, 99.9, 100.0, 150.0, 1000.0, 1e5, 1e7}) {
    this->expect_laws(text_of("poisson", rate), rng::poisson<>(rate),
                      {law_of_approximation(laws::poisson(static_cast<float>(rate)))},
                      results_of_approximation);
  }
}

// Probabilities are those of the parameter in single precision; a word as a float has 24 bits.
laws::view law_of_floats(const laws::law& of) {
  laws::view seen = law_of_integers(of);
  seen.resolution.probability = 0x1p-22;
  return seen;
}

TYPED_TEST(inversion_laws, of_geometric_hold) {
  for (const float p : {1e-4f, 0.003f, 0.05f, 0.2f, 0.5f, 0.7f, 0.99f}) {
    this->expect_laws(text_of("geometric", p), rng::geometric<>(static_cast<double>(p)),
                      {law_of_floats(laws::geometric(p))});
  }
}

TYPED_TEST(inversion_laws, of_bernoulli_hold) {
  for (const float p : {0.0f, 1e-4f, 0.01f, 0.25f, 0.5f, 0.7f, 0.999f}) {
    this->expect_laws(text_of("bernoulli", p), rng::bernoulli<>(static_cast<double>(p)),
                      {law_of_floats(laws::bernoulli(p))});
  }
}

TARN_REPORTS_CUDA(inversion_laws)

}  // namespace
