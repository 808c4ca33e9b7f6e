// SPDX-License-Identifier: Apache-2.0
// gamma on a GPU against its serial model, bit by bit.
#include <array>
#include <cmath>
#include <cstddef>
#include <limits>
#include <string_view>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "candidate_models.hpp"
#include "distributions/gamma_gpu_dispatch.hpp"
#include "models/gamma_model.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using tarn_test::gamma_model;
using tarn_test::model_road;
using tarn_test::step_counts;

template <typename T>
struct candidate_models_gamma : testing::Test {};
using real_types = testing::Types<float, double>;
TYPED_TEST_SUITE(candidate_models_gamma, real_types);

/// Both sides of 0.6 and of 1, and far from them.
template <typename T>
std::vector<T> shapes() {
  const T infinity = std::numeric_limits<T>::infinity();
  return {T(0.05), T(0.3),
          T(0.6),  std::nextafter(T(0.6), infinity),
          T(0.9),  std::nextafter(T(1), T(0)),
          T(1),    std::nextafter(T(1), infinity),
          T(1.5),  T(50),
          T(1e6)};
}

/// What a candidate can go through.
const std::vector<std::string_view> candidate_steps = {
    "cube not above 0", "cube squeezes", "cube accepts",  "cube rejects", "weibull accepts",
    "weibull rejects",  "power accepts", "power rejects", "tail accepts", "tail rejects"};

TYPED_TEST(candidate_models_gamma, calls_equal_the_model) {
  using T = TypeParam;
  step_counts seen;
  for (const T shape : shapes<T>()) {
    SCOPED_TRACE(shape);
    const T a = T(-3.1);
    const T beta = T(0.7);
    gamma_model<T> standard(shape, a, beta, false, seen);
    gamma_model<T> accurate(shape, a, beta, true, seen);
    ASSERT_EQ(standard.road(), shape == 1 ? model_road::each : model_road::rejection);
    const auto counts = tarn_test::model_counts(shape == T(0.3) || shape == 1 || shape == 50);
    tarn_test::for_model_engines([&](auto tag) {
      using engine = typename decltype(tag)::type;
      tarn_test::expect_generate<engine>(
          rng::gamma<T, rng::gamma_method::marsaglia>(shape, a, beta), standard, counts);
      tarn_test::expect_level<engine>(
          rng::gamma<T, rng::gamma_method::marsaglia_accurate>(shape, a, beta), accurate);
    });
  }
  // "raised to a" is left to chosen candidates: v beta + a is never below a, nor rounds below it.
  auto steps = candidate_steps;
  steps.insert(steps.end(), {"exponential"});
  tarn_test::expect_steps(seen, steps);
}

template <typename T>
void expect_fours(gamma_model<T>& model, T shape) {
  const auto functor = gpu::gamma_candidates(shape);
  EXPECT_EQ(functor.alpha, shape);
  EXPECT_EQ(static_cast<int>(functor.method), model.method());
  EXPECT_TRUE(tarn_test::same_bits(functor.k1, model.k1()));
  EXPECT_TRUE(tarn_test::same_bits(functor.k2, model.k2()));
  std::vector<T> uniforms = {0, std::numeric_limits<T>::min(), 1, 1 - T(0x1p-24), model.k2()};
  for (int i = 1; i < 8; ++i) {
    uniforms.push_back(static_cast<T>(i) / 8);
    uniforms.push_back(std::ldexp(T(1), -4 * i));
  }
  for (const T u0 : uniforms) {
    for (const T u2 : uniforms) {
      SCOPED_TRACE(testing::Message() << u0 << ", " << u2);
      // The second uniform decides on the first candidate, the fourth on the second.
      for (const int which : {0, 1}) {
        const auto four = [&](T v) {
          return std::array<T, 4>{u0, which == 0 ? v : T(0.5), u2, which == 1 ? v : T(0.5)};
        };
        const auto got = [&](T v) {
          const auto u = four(v);
          return T(functor(sycl::vec<T, 4>(u[0], u[1], u[2], u[3]))[which]);
        };
        const auto want = [&](T v) {
          return model.candidates(four(v).data())[static_cast<std::size_t>(which)];
        };
        ASSERT_NO_FATAL_FAILURE(tarn_test::expect_same_candidates<T>(got, want));
      }
    }
  }
}

// The functor by itself, 0 and 1 and small uniforms included, and its constants.
TYPED_TEST(candidate_models_gamma, candidates_of_chosen_uniforms_equal_the_model) {
  using T = TypeParam;
  step_counts seen;
  for (const T shape : shapes<T>()) {
    SCOPED_TRACE(shape);
    gamma_model<T> model(shape, 0, 1, false, seen);
    if (model.road() == model_road::rejection) {
      expect_fours(model, shape);
    }
  }
  tarn_test::expect_steps(seen, candidate_steps);
}

TYPED_TEST(candidate_models_gamma, placed_candidates_equal_the_model) {
  using T = TypeParam;
  step_counts seen;
  for (const bool accurate : {false, true}) {
    gamma_model<T> model(2, T(-3.1), T(0.7), accurate, seen);
    const gpu::functors::gamma_post<T> post{T(-3.1), T(0.7), accurate};
    for (const T v : {T(-0.25), T(0), T(1e-9), T(1), T(3.3), T(1e9)}) {
      EXPECT_TRUE(tarn_test::same_bits(post(v), model.post(v))) << v;
    }
  }
  EXPECT_EQ(seen.of["raised to a"], 1);
}

}  // namespace
