// SPDX-License-Identifier: Apache-2.0
// Parameters of the distribution classes: what they keep, their defaults, what they refuse and
// with which words; and the two lists themselves.
#include <cmath>
#include <cstdint>
#include <limits>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "frame/rows.hpp"
#include "message.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;

template <typename Make>
std::string refusal(Make make) {
  return tarn_test::message_of<tarn::invalid_argument>(make);
}

std::string expected(const std::string& distribution, const std::string& text) {
  return "kestrel::tarn::rng::" + distribution + ": invalid argument: " + text;
}

TEST(lists, have_thirteen_engines_and_eighty_nine_distributions) {
  int engines = 0;
#define TARN_ENGINE(...) ++engines;
#include "engines/engines.def"
  EXPECT_EQ(engines, 13);
  int distributions = 0;
#define TARN_DISTRIBUTION(...) ++distributions;
#include "distributions/distributions.def"
  EXPECT_EQ(distributions, 89);
}

// The multiplier is written out once more here, from the description of the methods.
TEST(lists, words_per_result) {
  using rng::detail::distribution_row;
  EXPECT_EQ(distribution_row<rng::uniform_bits<std::uint64_t>>::per_output_words, 2u);
  EXPECT_EQ(distribution_row<rng::laplace<float>>::per_output_words, 2u);
  EXPECT_EQ(distribution_row<rng::laplace<double>>::per_output_words, 2u);
  using box_muller = rng::gaussian_method::box_muller;
  EXPECT_EQ((distribution_row<rng::gaussian<float, box_muller>>::per_output_words), 2u);
  EXPECT_EQ((distribution_row<rng::gaussian<double, box_muller>>::per_output_words), 2u);
  std::uint64_t sum = 0;
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) sum += words;
#include "distributions/distributions.def"
  EXPECT_EQ(sum, 89u + 5u);  // every other row has 1
}

TEST(lists, nine_families_go_by_generate_ex) {
  std::vector<std::string> families;
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu)                      \
  if (std::string(#road) == "generate_ex" && (families.empty() || families.back() != #family)) \
    families.push_back(#family);
#include "distributions/distributions.def"
  EXPECT_EQ(families, (std::vector<std::string>{"gamma", "beta", "chi_square", "gaussian_mv",
                                                "poisson_v", "binomial", "negative_binomial",
                                                "hypergeometric", "multinomial"}));
}

TEST(parameters, are_kept) {
  const rng::uniform<double> uniform(-2.5, 4.0);
  EXPECT_EQ(uniform.a(), -2.5);
  EXPECT_EQ(uniform.b(), 4.0);
  const rng::lognormal<float> lognormal(1.0f, 2.0f, 3.0f, 4.0f);
  EXPECT_EQ(lognormal.m(), 1.0f);
  EXPECT_EQ(lognormal.s(), 2.0f);
  EXPECT_EQ(lognormal.displ(), 3.0f);
  EXPECT_EQ(lognormal.scale(), 4.0f);
  const rng::gamma<double> gamma(1.0, 2.0, 3.0);
  EXPECT_EQ(gamma.alpha(), 1.0);
  EXPECT_EQ(gamma.a(), 2.0);
  EXPECT_EQ(gamma.beta(), 3.0);
  const rng::beta<double> beta(1.0, 2.0, 3.0, 4.0);
  EXPECT_EQ(beta.p(), 1.0);
  EXPECT_EQ(beta.q(), 2.0);
  EXPECT_EQ(beta.a(), 3.0);
  EXPECT_EQ(beta.b(), 4.0);
  const rng::hypergeometric<> hypergeometric(30, 10, 20);
  EXPECT_EQ(hypergeometric.l(), 30);
  EXPECT_EQ(hypergeometric.s(), 10);
  EXPECT_EQ(hypergeometric.m(), 20);
  const rng::multinomial<> multinomial(7, {0.25, 0.75});
  EXPECT_EQ(multinomial.ntrial(), 7);
  EXPECT_EQ(multinomial.p(), (std::vector<double>{0.25, 0.75}));
  const rng::gaussian_mv<float, rng::matrix_layout::packed> mv(2, {1, 2}, {3, 4, 5});
  EXPECT_EQ(mv.dimension(), 2u);
  EXPECT_EQ(mv.mean(), (std::vector<float>{1, 2}));
  EXPECT_EQ(mv.matrix(), (std::vector<float>{3, 4, 5}));
}

TEST(parameters, have_standard_defaults) {
  EXPECT_EQ(rng::uniform<float>().a(), 0.0f);
  EXPECT_EQ(rng::uniform<float>().b(), 1.0f);
  EXPECT_EQ(rng::uniform<std::int32_t>().b(), std::numeric_limits<std::int32_t>::max());
  EXPECT_EQ(rng::gaussian<>().stddev(), 1.0f);
  EXPECT_EQ(rng::exponential<>().beta(), 1.0f);
  EXPECT_EQ(rng::bernoulli<>().p(), 0.5);
  EXPECT_EQ(rng::poisson<>().lambda(), 1.0);
}

TEST(parameters, refused_reals) {
  EXPECT_EQ(refusal([] { rng::gamma<float>(0.0f, 0.0f, 1.0f); }), expected("gamma", "alpha <= 0"));
  EXPECT_EQ(refusal([] { rng::gamma<double>(1.0, 0.0, -1.0); }), expected("gamma", "beta <= 0"));
  EXPECT_EQ(refusal([] { rng::exponential<float>(0.0f, 0.0f); }),
            expected("exponential", "beta <= 0"));
  EXPECT_EQ(refusal([] { rng::chi_square<double>(0); }), expected("chi_square", "n < 1"));
}

// A device would draw candidates for them for ever.
TEST(parameters, refused_as_nothing_would_be_accepted) {
  const double inf = std::numeric_limits<double>::infinity();
  const double no_number = std::numeric_limits<double>::quiet_NaN();
  EXPECT_EQ(refusal([=] { rng::gamma<double>(no_number, 0.0); }), expected("gamma", "alpha <= 0"));
  EXPECT_EQ(refusal([] { rng::beta<float>(0.0f, 1.0f); }), expected("beta", "p <= 0"));
  EXPECT_EQ(refusal([] { rng::beta<double>(1.0, -0.5); }), expected("beta", "q <= 0"));
  EXPECT_EQ(refusal([=] { rng::beta<double>(inf, 2.0); }), expected("beta", "p or q is infinite"));
  EXPECT_EQ(refusal([=] { rng::beta<double>(2.0, inf); }), expected("beta", "p or q is infinite"));
  EXPECT_EQ(refusal([] { rng::binomial<>(-1, 0.5); }), expected("binomial", "ntrial < 0"));
  EXPECT_EQ(refusal([] { rng::binomial<>(5, 1.5); }), expected("binomial", "p > 1 or p < 0"));
  EXPECT_EQ(refusal([] { rng::binomial<>(5, -0.5); }), expected("binomial", "p > 1 or p < 0"));
  EXPECT_EQ(refusal([=] { rng::binomial<>(5, no_number); }),
            expected("binomial", "p > 1 or p < 0"));
  const auto negative_binomial = [](double a, double p) {
    return refusal([=] { rng::negative_binomial<>(a, p); });
  };
  EXPECT_EQ(negative_binomial(0.0, 0.5), expected("negative_binomial", "a <= 0"));
  EXPECT_EQ(negative_binomial(no_number, 0.5), expected("negative_binomial", "a <= 0"));
  EXPECT_EQ(negative_binomial(inf, 0.5), expected("negative_binomial", "a is infinite"));
  EXPECT_EQ(negative_binomial(1.0, 0.0), expected("negative_binomial", "p > 1 or p <= 0"));
  EXPECT_EQ(negative_binomial(1.0, 1.5), expected("negative_binomial", "p > 1 or p <= 0"));
  EXPECT_EQ(negative_binomial(1.0, no_number), expected("negative_binomial", "p > 1 or p <= 0"));
}

TEST(parameters, ends_that_are_taken) {
  EXPECT_EQ(rng::binomial<>(0, 0.0).ntrial(), 0);
  EXPECT_EQ(rng::binomial<>(3, 1.0).p(), 1.0);
  EXPECT_EQ(rng::negative_binomial<>(0.5, 1.0).p(), 1.0);
  EXPECT_TRUE(std::isnan(rng::beta<double>(std::nan(""), 2.0).p()));
}

// The words do not always fit the condition: they have been in use for long and are compared.
TEST(parameters, refused_integers) {
  EXPECT_EQ(refusal([] { rng::poisson<>(0.0); }), expected("poisson", "lamdba < 0"));
  EXPECT_EQ(refusal([] { rng::poisson_v<>(std::vector<double>{}); }),
            expected("poisson_v", "size of lambda < 0"));
  EXPECT_EQ(refusal([] { rng::bernoulli<>(1.5); }), expected("bernoulli", "p > 1 or p < 0"));
  EXPECT_EQ(refusal([] { rng::bernoulli<>(-0.5); }), expected("bernoulli", "p > 1 or p < 0"));
  EXPECT_EQ(refusal([] { rng::geometric<>(1.0); }), expected("geometric", "p > 1 or p < 0"));
  EXPECT_EQ(refusal([] { rng::geometric<>(0.0); }), expected("geometric", "p > 1 or p < 0"));
  EXPECT_EQ(refusal([] { rng::hypergeometric<>(5, -1, 0); }), expected("hypergeometric", "s < 0"));
  EXPECT_EQ(refusal([] { rng::hypergeometric<>(5, 0, -1); }), expected("hypergeometric", "m < 0"));
  EXPECT_EQ(refusal([] { rng::hypergeometric<>(5, 6, 2); }),
            expected("hypergeometric", "l < (s > m ? s : m)"));
  EXPECT_EQ(refusal([] { rng::hypergeometric<>(5, 2, 6); }),
            expected("hypergeometric", "l < (s > m ? s : m)"));
}

TEST(parameters, bernoulli_takes_both_ends_and_geometric_none) {
  EXPECT_EQ(rng::bernoulli<>(0.0).p(), 0.0);
  EXPECT_EQ(rng::bernoulli<>(1.0).p(), 1.0);
  EXPECT_EQ(rng::geometric<>(0.999).p(), 0.999);
}

template <rng::matrix_layout layout>
std::string mv_refusal(std::uint32_t dimension, std::size_t mean, std::size_t matrix) {
  return refusal([=] {
    rng::gaussian_mv<double, layout>(dimension, std::vector<double>(mean),
                                     std::vector<double>(matrix));
  });
}

TEST(parameters, gaussian_mv_sizes_follow_the_layout) {
  using rng::matrix_layout;
  EXPECT_EQ(mv_refusal<matrix_layout::full>(3, 2, 9),
            expected("gaussian_mv", "'mean' vector size is incorrect"));
  EXPECT_EQ(mv_refusal<matrix_layout::full>(3, 3, 8),
            expected("gaussian_mv", "'matrix' size is incorrect"));
  EXPECT_EQ(mv_refusal<matrix_layout::packed>(3, 3, 9),
            expected("gaussian_mv", "'matrix' size is incorrect"));
  EXPECT_EQ(mv_refusal<matrix_layout::diagonal>(3, 3, 6),
            expected("gaussian_mv", "'matrix' size is incorrect"));
  EXPECT_EQ(mv_refusal<matrix_layout::full>(3, 3, 9), "[nothing raised]");
  EXPECT_EQ(mv_refusal<matrix_layout::packed>(3, 3, 6), "[nothing raised]");
  EXPECT_EQ(mv_refusal<matrix_layout::diagonal>(3, 3, 3), "[nothing raised]");
}

}  // namespace
