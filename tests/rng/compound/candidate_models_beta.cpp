// SPDX-License-Identifier: Apache-2.0
// beta on a GPU against its serial model, bit by bit.
#include <cstddef>
#include <iterator>
#include <limits>
#include <string_view>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "candidate_models.hpp"
#include "distributions/beta_gpu_dispatch.hpp"
#include "models/beta_model.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using tarn_test::beta_model;
using tarn_test::model_road;
using tarn_test::step_counts;

template <typename T>
struct candidate_models_beta : testing::Test {};
using real_types = testing::Types<float, double>;
TYPED_TEST_SUITE(candidate_models_beta, real_types);

struct shapes {
  double p, q;
  int method;  // -1: a shape is 1
  bool every_count = false;
};

constexpr shapes cases[] = {{0.5, 0.5, 0},  {0.001, 0.002, 0}, {0.9, 0.9, 1},    {0.99, 0.2, 1},
                            {0.7, 0.85, 1}, {0.5, 2, 2},       {0.99, 1.01, 2},  {2, 0.5, 3},
                            {7, 0.1, 3},    {2, 3, 4, true},   {50, 80, 4},      {1.01, 1.01, 4},
                            {1, 1, -1},     {1, 3, -1},        {3, 1, -1, true}, {0.25, 1, -1}};

/// What a candidate can go through.
const std::vector<std::string_view> candidate_steps = {
    "johnk: both powers 0", "johnk accepts",    "johnk rejects",    "1: upper accepts",
    "1: upper rejects",     "1: lower accepts", "1: lower rejects", "2: upper accepts",
    "2: upper rejects",     "2: lower accepts", "2: lower rejects", "3: upper accepts",
    "3: upper rejects",     "3: lower accepts", "3: lower rejects", "cheng accepts",
    "cheng rejects"};

TYPED_TEST(candidate_models_beta, calls_equal_the_model) {
  using T = TypeParam;
  step_counts seen;
  for (const shapes& c : cases) {
    SCOPED_TRACE(testing::Message() << c.p << ", " << c.q);
    const T p = static_cast<T>(c.p);
    const T q = static_cast<T>(c.q);
    const T a = T(-1.1);
    const T b = T(1.7);
    beta_model<T> standard(p, q, a, b, false, seen);
    beta_model<T> accurate(p, q, a, b, true, seen);
    ASSERT_EQ(standard.road(), c.method < 0 ? model_road::each : model_road::rejection);
    if (c.method >= 0) {
      ASSERT_EQ(standard.method(), c.method);
    }
    const auto counts = tarn_test::model_counts(c.every_count);
    tarn_test::for_model_engines([&](auto tag) {
      using engine = typename decltype(tag)::type;
      tarn_test::expect_generate<engine>(rng::beta<T, rng::beta_method::cja>(p, q, a, b), standard,
                                         counts);
      tarn_test::expect_level<engine>(rng::beta<T, rng::beta_method::cja_accurate>(p, q, a, b),
                                      accurate);
    });
  }
  // The clamps are left to chosen candidates: a variate of [0, 1] is placed in [a, a + b], and
  // rounding keeps it there.
  auto steps = candidate_steps;
  steps.insert(steps.end(), {"first shape 1", "second shape 1"});
  tarn_test::expect_steps(seen, steps);
}

template <typename T>
void expect_pairs(beta_model<T>& model, T p, T q) {
  const auto& k = model.constants();
  const auto functor = gpu::beta_candidates_of(p, q);
  EXPECT_EQ(static_cast<int>(functor.method), model.method());
  // Constants that a method has no use for are 0 in the model.
  const T constants[] = {functor.split, functor.t,   functor.w1, functor.w2,     functor.e1,
                         functor.e2,    functor.r1t, functor.rt, functor.inv[0], functor.inv[1],
                         functor.s,     functor.bb,  functor.cc};
  const T model_constants[] = {k.split, k.t,      k.w1,     k.w2, k.e1, k.e2, k.r1t,
                               k.rt,    k.inv[0], k.inv[1], k.s,  k.bb, k.cc};
  for (std::size_t i = 0; i < std::size(constants); ++i) {
    if (model_constants[i] != 0) {
      EXPECT_TRUE(tarn_test::same_bits(constants[i], model_constants[i])) << "constant " << i;
    }
  }
  for (const double u : tarn_test::crowded_uniforms({0, 1, static_cast<double>(k.split)})) {
    SCOPED_TRACE(u);
    const auto got = [&](T v) {
      T candidate = 0;
      functor.pair(static_cast<T>(u), v, &candidate);
      return candidate;
    };
    const auto want = [&](T v) { return model.candidate(static_cast<T>(u), v); };
    ASSERT_NO_FATAL_FAILURE(tarn_test::expect_same_candidates<T>(got, want));
  }
}

// The functor by itself, 0 and 1 and small uniforms included, and its constants.
TYPED_TEST(candidate_models_beta, candidates_of_chosen_uniforms_equal_the_model) {
  using T = TypeParam;
  step_counts seen;
  for (const shapes& c : cases) {
    SCOPED_TRACE(testing::Message() << c.p << ", " << c.q);
    const T p = static_cast<T>(c.p);
    const T q = static_cast<T>(c.q);
    beta_model<T> model(p, q, 0, 1, false, seen);
    if (model.road() == model_road::rejection) {
      expect_pairs(model, p, q);
    }
  }
  tarn_test::expect_steps(seen, candidate_steps);
}

TYPED_TEST(candidate_models_beta, placed_candidates_equal_the_model) {
  using T = TypeParam;
  step_counts seen;
  for (const bool accurate : {false, true}) {
    beta_model<T> model(2, 2, T(-1.1), T(1.7), accurate, seen);
    const gpu::functors::beta_post<T> post{T(-1.1), T(1.7), accurate};
    for (const T v : {T(-0.25), T(0), T(1e-9), T(0.3), T(1), T(1.25)}) {
      EXPECT_TRUE(tarn_test::same_bits(post(v), model.post(v))) << v;
    }
  }
  EXPECT_EQ(seen.of["raised to a"], 1);
  EXPECT_EQ(seen.of["lowered to a + b"], 1);
}

// A shape that is no number leaves the uniforms of [a, a + b].
TYPED_TEST(candidate_models_beta, a_shape_that_is_no_number_gives_uniforms) {
  using T = TypeParam;
  const T nan = std::numeric_limits<T>::quiet_NaN();
  const T a = T(-1.1);
  const T b = T(1.7);
  tarn_test::for_model_engines([&](auto tag) {
    using engine = typename decltype(tag)::type;
    engine host = tarn_test::model_engine<engine>(tarn_test::cpu_queue());
    engine device = tarn_test::model_engine<engine>(tarn_test::host_run_gpu_queue());
    tarn_test::expect_values(tarn_test::draw(rng::beta<T>(nan, 2, a, b), device, 1001),
                             tarn_test::draw(rng::uniform<T>(a, a + b), host, 1001));
  });
}

}  // namespace
