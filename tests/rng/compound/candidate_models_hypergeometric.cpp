// SPDX-License-Identifier: Apache-2.0
// hypergeometric on a GPU against its serial model, value by value.
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "candidate_models.hpp"
#include "distributions/hypergeometric_gpu_dispatch.hpp"
#include "models/h2pe_model.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using tarn_test::h2pe_constants;
using tarn_test::h2pe_model;
using tarn_test::model_road;
using tarn_test::step_counts;

struct parameters {
  std::int32_t l, s, m;
  model_road road;
  bool every_count = false;
};

// Samples and classes on both sides of half the lot, and a mode of 39 and of 40. Without marked
// items, or with nothing else, a small sample is the result itself: kept. From a mode of 100 on
// candidates above 200 go to the squeeze: a mode of 265 puts 65 below it, behind the table of
// ratios, within reach on the other side of 200.
constexpr parameters cases[] = {{100, 0, 30, model_road::constant, true},
                                {100, 20, 0, model_road::constant},
                                {100, 20, 100, model_road::constant},
                                {100, 100, 30, model_road::constant},
                                {100, 100, 80, model_road::constant},
                                {100, 80, 0, model_road::constant},
                                {10, 5, 5, model_road::each, true},
                                {100, 20, 30, model_road::each},
                                {100, 20, 80, model_road::each},
                                {100, 80, 30, model_road::each},
                                {100, 80, 80, model_road::each},
                                {1000, 200, 195, model_road::each},
                                {1000, 200, 199, model_road::rejection},
                                {2147483647, 70000, 1000000, model_road::each},
                                {160, 80, 80, model_road::rejection},
                                {100000, 20000, 400, model_road::rejection, true},
                                {2147483647, 2147000000, 435000, model_road::rejection},
                                {2000, 900, 800, model_road::rejection},
                                {2000, 900, 1200, model_road::rejection},
                                {2000, 1100, 800, model_road::rejection},
                                {2000, 1100, 1200, model_road::rejection},
                                {1000000000, 26500, 10000000, model_road::rejection},
                                {1000000000, 9900, 10000000, model_road::rejection},
                                {1000000000, 21000, 10000000, model_road::rejection},
                                {2147483647, 2000000000, 1500000000, model_road::rejection}};

std::string name_of(const parameters& c) {
  return std::to_string(c.s) + " of " + std::to_string(c.l) + ", " + std::to_string(c.m) +
         " marked";
}

/// What a candidate can go through, but for what takes a uniform of 1e-9.
const std::vector<std::string_view> candidate_steps = {"body",
                                                       "left tail",
                                                       "right tail",
                                                       "at mode",
                                                       "table below accepts",
                                                       "table below rejects",
                                                       "table above accepts",
                                                       "table above rejects",
                                                       "surely inside",
                                                       "surely outside",
                                                       "inside",
                                                       "outside",
                                                       "walk above rejects",
                                                       "walk below accepts",
                                                       "walk below rejects"};

TEST(candidate_models_hypergeometric, calls_equal_the_model) {
  step_counts seen;
  for (const parameters& c : cases) {
    SCOPED_TRACE(name_of(c));
    h2pe_model model(c.l, c.s, c.m, seen);
    ASSERT_EQ(model.road(), c.road);
    const auto counts = tarn_test::model_counts(c.every_count);
    tarn_test::for_model_engines([&](auto tag) {
      using engine = typename decltype(tag)::type;
      tarn_test::expect_generate<engine>(rng::hypergeometric<std::int32_t>(c.l, c.s, c.m), model,
                                         counts);
      tarn_test::expect_level<engine>(rng::hypergeometric<std::uint32_t>(c.l, c.s, c.m), model);
    });
  }
  auto steps = candidate_steps;
  steps.insert(steps.end(), {"table first", "table later"});
  tarn_test::expect_steps(seen, steps);
}

// The functor by itself on uniforms that engines seldom or never deliver, and its constants. Walks
// above the mode and the greatest value are six deviations away.
TEST(candidate_models_hypergeometric, candidates_of_chosen_uniforms_equal_the_model) {
  step_counts seen;
  for (const parameters& c : cases) {
    if (c.road != model_road::rejection) {
      continue;
    }
    SCOPED_TRACE(name_of(c));
    h2pe_model model(c.l, c.s, c.m, seen);
    const h2pe_constants& k = model.constants();
    const auto law = gpu::canonical_form(c.l, c.s, c.m);
    const auto params = gpu::h2pe_record(law);
    // Behind three integers and a gap.
    tarn_test::expect_same_doubles(params, k, offsetof(h2pe_constants, p1));
    const auto functor = gpu::h2pe_functor(law, &params);
    for (const double u : tarn_test::crowded_uniforms({k.p1 / k.p3, k.p2 / k.p3})) {
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
  auto steps = candidate_steps;
  steps.insert(steps.end(), {"left of all", "right of all", "walk above accepts"});
  tarn_test::expect_steps(seen, steps);
}

TEST(candidate_models_hypergeometric, tables_equal_the_model) {
  step_counts seen;
  for (const parameters& c : cases) {
    if (c.road != model_road::each) {
      continue;
    }
    SCOPED_TRACE(name_of(c));
    const h2pe_model model(c.l, c.s, c.m, seen);
    EXPECT_EQ(gpu::hypergeometric_table(gpu::canonical_form(c.l, c.s, c.m)), model.cdf());
  }
}

}  // namespace
