// SPDX-License-Identifier: Apache-2.0
// binomial on a GPU against its serial model, value by value.
#include <cmath>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "candidate_models.hpp"
#include "distributions/binomial_gpu_dispatch.hpp"
#include "models/btpe_model.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using tarn_test::btpe_constants;
using tarn_test::btpe_model;
using tarn_test::model_road;
using tarn_test::step_counts;

struct parameters {
  std::int32_t ntrial;
  double p;
  model_road road;
  bool every_count = false;
};

// Both sides of a mean of 30 and of p = 1/2. The squeeze needs a variance above 42, and walks
// behind the 32 entries of a ratio table that are accepted one about 66, since from 68 on the
// squeeze takes what is 33 from the mode.
constexpr parameters cases[] = {{0, 0.3, model_road::constant, true},
                                {5, 0.5, model_road::each},
                                {20, 0.0, model_road::each},
                                {20, 1.0, model_road::each},
                                {40, 0.9, model_road::each, true},
                                {100, 0.2999, model_road::each},
                                {100, 0.3, model_road::rejection},
                                {60, 0.5, model_road::rejection},
                                {100, 0.7, model_road::rejection},
                                {264, 0.5, model_road::rejection},
                                {264, 0.499, model_road::rejection},
                                {6000000, 1.1e-5, model_road::rejection},
                                {1000, 0.3, model_road::rejection, true},
                                {500, 0.9, model_road::rejection},
                                {100000, 0.45, model_road::rejection},
                                {2147483647, 1e-8, model_road::each},
                                {2147483647, 0.5, model_road::rejection}};

std::string name_of(const parameters& c) {
  return std::to_string(c.ntrial) + " trials of probability " + std::to_string(c.p);
}

/// What a candidate can go through.
const std::vector<std::string_view> candidate_steps = {"triangle",
                                                       "right tail",
                                                       "right of all",
                                                       "left tail",
                                                       "left of all",
                                                       "parallelogram",
                                                       "above parallelogram",
                                                       "surely inside",
                                                       "surely outside",
                                                       "inside",
                                                       "outside",
                                                       "at mode",
                                                       "table below accepts",
                                                       "table below rejects",
                                                       "table end below rejects",
                                                       "walk below accepts",
                                                       "walk below rejects",
                                                       "table above accepts",
                                                       "table above rejects",
                                                       "table end above rejects",
                                                       "walk above accepts",
                                                       "walk above rejects"};

TEST(candidate_models_binomial, calls_equal_the_model) {
  step_counts seen;
  for (const parameters& c : cases) {
    SCOPED_TRACE(name_of(c));
    btpe_model model(c.ntrial, c.p, seen);
    ASSERT_EQ(model.road(), c.road);
    const auto counts = tarn_test::model_counts(c.every_count);
    tarn_test::for_model_engines([&](auto tag) {
      using engine = typename decltype(tag)::type;
      tarn_test::expect_generate<engine>(rng::binomial<std::int32_t>(c.ntrial, c.p), model, counts);
      tarn_test::expect_level<engine>(rng::binomial<std::uint32_t>(c.ntrial, c.p), model);
    });
  }
  auto steps = candidate_steps;
  steps.insert(steps.end(), {"table first", "table later"});
  tarn_test::expect_steps(seen, steps);
}

// The functor by itself on uniforms that engines seldom or never deliver, and its constants.
TEST(candidate_models_binomial, candidates_of_chosen_uniforms_equal_the_model) {
  step_counts seen;
  for (const parameters& c : cases) {
    if (c.road != model_road::rejection) {
      continue;
    }
    SCOPED_TRACE(name_of(c));
    btpe_model model(c.ntrial, c.p, seen);
    const btpe_constants& k = model.constants();
    const auto params = gpu::btpe_record(c.ntrial, c.p);
    tarn_test::expect_same_doubles(params, k);
    const gpu::functors::binomial<gpu::binomial_algorithm::btpe> functor{0, 1, &params, c.ntrial};
    for (const double u : tarn_test::crowded_uniforms({k.p1 / k.p4, k.p2 / k.p4, k.p3 / k.p4})) {
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
  tarn_test::expect_steps(seen, candidate_steps);
}

TEST(candidate_models_binomial, tables_equal_the_model) {
  for (const parameters& c : cases) {
    if (c.road != model_road::each) {
      continue;
    }
    SCOPED_TRACE(name_of(c));
    const auto record = gpu::bcdf_record(c.ntrial, c.p);
    const auto cdf = tarn_test::binomial_cdf(c.ntrial, c.p);
    ASSERT_LE(cdf.size(), 61u);  // which a mean of 29 has
    for (std::size_t k = 0; k < cdf.size(); ++k) {
      EXPECT_TRUE(tarn_test::same_bits(record.cdf[k], cdf[k])) << k;
    }
  }
}

}  // namespace
