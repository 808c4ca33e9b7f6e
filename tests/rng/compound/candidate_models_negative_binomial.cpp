// SPDX-License-Identifier: Apache-2.0
// negative_binomial on a GPU against its serial model, value by value.
#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "candidate_models.hpp"
#include "distributions/negbinomial_gpu_dispatch.hpp"
#include "models/nbar_model.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
namespace service = kestrel::tarn::service;
using tarn_test::model_road;
using tarn_test::nbar_constants;
using tarn_test::nbar_model;
using tarn_test::step_counts;

struct parameters {
  double a, p;
  model_road road;
  bool every_count = false;
};

// Both sides of (a - 1) (1 - p) / p = 100; shapes below 1, whose mode is below 0; long tails, where
// the table ends early; constants from the tables of ratios (small deviations) and from the
// density; a mean next to the greatest result.
constexpr parameters cases[] = {
    {5, 0.5, model_road::each, true},  {0.5, 0.01, model_road::each},
    {1.05, 0.01, model_road::each},    {100, 0.999, model_road::each},
    {3, 1.0, model_road::each},        {100.999, 0.5, model_road::each},
    {101, 0.5, model_road::rejection}, {201, 0.5, model_road::rejection, true},
    {130, 0.4, model_road::rejection}, {400, 0.7, model_road::rejection},
    {50, 0.1, model_road::rejection},  {3, 0.0125, model_road::rejection},
    {20, 0.01, model_road::rejection}, {10000, 0.3, model_road::rejection},
    {3, 0.001, model_road::rejection}, {2149632, 0.001, model_road::rejection}};

std::string name_of(const parameters& c) {
  return std::to_string(c.a) + " successes of probability " + std::to_string(c.p);
}

TEST(candidate_models_negative_binomial, calls_equal_the_model) {
  step_counts seen;
  for (const parameters& c : cases) {
    SCOPED_TRACE(name_of(c));
    nbar_model model(c.a, c.p, seen);
    ASSERT_EQ(model.road(), c.road);
    const auto counts = tarn_test::model_counts(c.every_count);
    tarn_test::for_model_engines([&](auto tag) {
      using engine = typename decltype(tag)::type;
      tarn_test::expect_generate<engine>(rng::negative_binomial<std::int32_t>(c.a, c.p), model,
                                         counts);
      tarn_test::expect_level<engine>(rng::negative_binomial<std::uint32_t>(c.a, c.p), model);
    });
  }
  tarn_test::expect_steps(seen, {"table first",
                                 "table later",
                                 "behind the table",
                                 "constant of the table",
                                 "constant of the density",
                                 "centre right squeezes",
                                 "centre right tests",
                                 "centre left squeezes",
                                 "centre left tests",
                                 "slope right squeezes",
                                 "slope right tests",
                                 "slope left squeezes",
                                 "slope left tests",
                                 "tail right",
                                 "tail left",
                                 "left of all",
                                 "mode from the right",
                                 "mode from the left",
                                 "table right",
                                 "table right accepts",
                                 "table right rejects",
                                 "density right accepts",
                                 "density right rejects",
                                 "table left",
                                 "table left accepts",
                                 "table left rejects",
                                 "density left accepts",
                                 "density left rejects",
                                 "walk rejects",
                                 "accepted",
                                 "below the ceiling",
                                 "ceiling"});
}

void expect_candidates(nbar_model& model, const parameters& c) {
  const nbar_constants& k = model.constants();
  service::_nbar_params params;
  static_assert(sizeof params == sizeof k);
  std::memcpy(&params, &k, sizeof params);
  const gpu::functors::negative_binomial<gpu::negative_binomial_algorithm::nbar> functor{
      0, 1, &params, c.a - 1, 1 - c.p};
  for (const double u : tarn_test::crowded_uniforms({k.P[0], k.P[1], k.P[2], k.P[3]})) {
    SCOPED_TRACE(u);
    const auto got = [&](double v) {
      std::int32_t candidate = 0;
      functor.pair(u, v, &candidate);
      return candidate;
    };
    const auto want = [&](double v) { return model.candidate(u, v); };
    ASSERT_NO_FATAL_FAILURE(tarn_test::expect_same_candidates<double>(got, want));
  }
}

// The functor by itself on uniforms that engines seldom or never deliver, and its constants.
TEST(candidate_models_negative_binomial, candidates_of_chosen_uniforms_equal_the_model) {
  step_counts seen;
  for (const parameters& c : cases) {
    if (c.road == model_road::rejection) {
      SCOPED_TRACE(name_of(c));
      nbar_model model(c.a, c.p, seen);
      tarn_test::expect_same_doubles(gpu::nbar_record(c.a, c.p), model.constants());
      expect_candidates(model, c);
    }
  }
  EXPECT_GT(seen.of["left of all"], 0);
  EXPECT_GT(seen.of["ceiling"], 0);
  EXPECT_GT(seen.of["walk rejects"], 0);
}

// The walk on the left never accepts: it would take down[63] >= (a - 1) (1 - p). The left side is a
// density over that at the mode, 1 at most; the right side is above 1 wherever the left end of the
// centre, about mu - mu / sqrt((a - 1) (1 - p)), is above 0. Under a table raised by hand it does.
TEST(candidate_models_negative_binomial, walks_accept_under_a_raised_table) {
  const parameters c{3, 0.0125, model_road::rejection};
  step_counts seen;
  nbar_model model(c.a, c.p, seen);
  // A factor of about 1 / 2 a step: ends of the walk where rounding and w decide, and later ones.
  for (const double end : {1.9939, 3.99, 8.05, 1e6}) {
    model.constants().down[63] = end;
    expect_candidates(model, c);
  }
  EXPECT_GT(seen.of["walk accepts"], 0);
  EXPECT_GT(seen.of["walk rejects"], 0);
}

TEST(candidate_models_negative_binomial, tables_equal_the_model) {
  for (const parameters& c : cases) {
    if (c.road == model_road::each) {
      SCOPED_TRACE(name_of(c));
      std::vector<double> cdf(
          static_cast<std::size_t>(gpu::negative_binomial_table_size(c.a, c.p)));
      gpu::fill_negative_binomial_table(c.a, c.p, static_cast<std::int32_t>(cdf.size()),
                                        cdf.data());
      EXPECT_EQ(cdf, tarn_test::negative_binomial_cdf(c.a, c.p));
    }
  }
}

}  // namespace
