// SPDX-License-Identifier: Apache-2.0
// Calls of rejecting distributions on a virtual GPU against their serial models (tests/models),
// which get the same uniforms from an engine on a CPU queue: every value, the count of words, and
// where the engine stands afterwards.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "frame/rows.hpp"
#include "models/rejection_model.hpp"
#include "queues.hpp"

namespace tarn_test {

/// Calls of both kinds: below 10000 with a capacity of their own, and from there on with one that
/// depends on the device, 62500 candidates on the one that tests see, which the last call fills.
/// Which passes there are has little to do with the parameters: most cases take two counts.
inline std::vector<std::int64_t> model_counts(bool every_count) {
  if (every_count) {
    return {1, 7, 9999, 10000, 30000, 70000};
  }
  return {7, 30000};
}

/// An engine whose words are one sequence on both roads.
template <typename Engine>
Engine model_engine(const sycl::queue& queue) {
  if constexpr (std::is_same_v<Engine, rng::mt2203>) {
    return Engine(queue, 77, 5);
  } else if constexpr (std::is_same_v<Engine, rng::sobol>) {
    return Engine(queue, 1);
  } else {
    return Engine(queue, 77);
  }
}

template <typename T>
struct type_tag {
  using type = T;
};

/// check(type_tag<Engine>) for the engines whose uniforms come from different rules and kernels.
template <typename Check>
void for_model_engines(const Check& check) {
  const auto traced = [&](auto engine) {
    SCOPED_TRACE(rng::detail::engine_row<typename decltype(engine)::type>::name);
    check(engine);
  };
  traced(type_tag<rng::philox4x32x10>());
  traced(type_tag<rng::mcg59>());
  traced(type_tag<rng::mrg32k3a>());
  traced(type_tag<rng::mt19937>());
  traced(type_tag<rng::sobol>());
  traced(type_tag<rng::mt2203>());
}

/// What the model says of a call, and the uniforms behind those that it takes.
template <typename Model>
struct model_expectation {
  model_call<typename Model::value> call;
  std::vector<typename Model::source> next;
};

inline constexpr std::int64_t next_uniforms = 5;

template <typename Engine, typename Model>
model_expectation<Model> expectation(Model& model, std::int64_t n) {
  static sycl::queue device = host_run_gpu_queue();
  const auto group_size = static_cast<std::int64_t>(
      device.get_device().get_info<sycl::info::device::max_work_group_size>());
  Engine engine = model_engine<Engine>(cpu_queue());
  const auto take = [&](std::int64_t count) {
    return draw(rng::uniform<typename Model::source>(0, 1), engine, count);
  };
  auto call = model_results(model, n, group_size, take);
  return {std::move(call), take(next_uniforms)};
}

template <typename T, typename Value>
void expect_values(const std::vector<T>& got, const std::vector<Value>& want) {
  ASSERT_EQ(got.size(), want.size());
  for (std::size_t i = 0; i < got.size(); ++i) {
    ASSERT_TRUE(same_bits(got[i], static_cast<T>(want[i])))
        << got[i] << " instead of " << want[i] << " at " << i << " of " << got.size();
  }
}

/// generate.
template <typename Engine, typename Distr, typename Model>
void expect_generate(const Distr& distr, Model& model, const std::vector<std::int64_t>& counts) {
  for (const std::int64_t n : counts) {
    SCOPED_TRACE(n);
    const auto want = expectation<Engine>(model, n);
    Engine engine = model_engine<Engine>(host_run_gpu_queue());
    expect_values(draw(distr, engine, n), want.call.values);
    EXPECT_EQ(draw(rng::uniform<typename Model::source>(0, 1), engine, next_uniforms), want.next);
    if (testing::Test::HasFatalFailure()) {
      return;
    }
  }
}

/// The same one level below, into a buffer, with the count of words.
template <typename Engine, typename Distr, typename Model>
void expect_level(const Distr& distr, Model& model) {
  constexpr std::int64_t n = 2001;
  const auto want = expectation<Engine>(model, n);
  Engine engine = model_engine<Engine>(host_run_gpu_queue());
  std::vector<typename Distr::result_type> values(n, marker<typename Distr::result_type>());
  {
    sycl::buffer<typename Distr::result_type, 1> buffer(values.data(), sycl::range<1>(n));
    const auto [last, consumed] = rng::detail::gpu::generate_ex(
        engine.get_queue(), distr, rng::detail::engine_access::impl(engine), n, buffer, {});
    EXPECT_EQ(consumed, want.call.consumed);
  }
  expect_values(values, want.call.values);
  EXPECT_EQ(draw(rng::uniform<typename Model::source>(0, 1), engine, next_uniforms), want.next);
}

/// The doubles of two records from byte `first` on.
template <typename Record, typename Constants>
void expect_same_doubles(const Record& got, const Constants& want, std::size_t first = 0) {
  static_assert(sizeof(Record) == sizeof(Constants));
  for (std::size_t i = first; i < sizeof(Record); i += sizeof(double)) {
    double x = 0;
    double y = 0;
    std::memcpy(&x, reinterpret_cast<const char*>(&got) + i, sizeof x);
    std::memcpy(&y, reinterpret_cast<const char*>(&want) + i, sizeof y);
    EXPECT_TRUE(same_bits(x, y)) << x << " instead of " << y << " at byte " << i;
  }
}

/// The same bits, or both no number: a candidate that is rejected whatever its bits are.
template <typename T>
bool same_candidate(T got, T want) {
  return same_bits(got, want) || (got != got && want != want);
}

/// Every step has run, and no other.
inline void expect_steps(const step_counts& seen, std::vector<std::string_view> steps) {
  std::vector<std::string_view> ran;
  for (const auto& step : seen.of) {
    ran.push_back(step.first);
  }
  std::sort(steps.begin(), steps.end());
  EXPECT_EQ(ran, steps);
}

/// Uniforms that spread over [0, 1) and crowd around the places where a method changes its way.
inline std::vector<double> crowded_uniforms(std::initializer_list<double> places) {
  std::vector<double> uniforms;
  for (int i = 0; i < 256; ++i) {
    uniforms.push_back(i / 256.0);
  }
  for (const double place : places) {
    for (const double u : {place, std::nextafter(place, 0.0), std::nextafter(place, 1.0)}) {
      uniforms.push_back(u);
    }
    for (int k = 8; k < 48; k += 4) {
      uniforms.push_back(place * (1 - std::ldexp(1.0, -k)));
      uniforms.push_back(place + (1 - place) * std::ldexp(1.0, -k));
    }
  }
  return uniforms;
}

/// Uniforms of every order of magnitude, and those that spread over [0, 1), in order.
inline std::vector<double> graded_uniforms() {
  std::vector<double> uniforms = {0, 1 - 0x1p-32, 1 - 0x1p-53};
  for (int i = 1; i < 256; ++i) {
    uniforms.push_back(std::exp2(-i / 4.0));
    uniforms.push_back(i / 256.0);
  }
  std::sort(uniforms.begin(), uniforms.end());
  return uniforms;
}

/// The candidates got(v) and want(v) for graded v, and for the neighbours of a place between any
/// two of them where the model's candidate changes: a count, or whether a real is accepted.
template <typename R, typename Got, typename Want>
void expect_same_candidates(const Got& got, const Want& want) {
  const auto key = [](auto candidate) {
    using T = decltype(candidate);
    return std::is_integral_v<T> ? candidate : static_cast<T>(candidate >= 0 ? 1 : 0);
  };
  const auto expect_same = [&](R v) {
    ASSERT_TRUE(same_candidate(got(v), want(v)))
        << got(v) << " instead of " << want(v) << " for " << v;
  };
  R low = 0;
  for (const double grade : graded_uniforms()) {
    const R next = static_cast<R>(grade);
    ASSERT_NO_FATAL_FAILURE(expect_same(next));
    for (R high = next; key(want(low)) != key(want(high));) {
      const R middle = low + (high - low) / 2;
      if (middle == low || middle == high) {
        for (const R v : {std::nextafter(low, R(0)), low, high, std::nextafter(high, R(1))}) {
          ASSERT_NO_FATAL_FAILURE(expect_same(v));
        }
        break;
      }
      (key(want(middle)) == key(want(low)) ? low : high) = middle;
    }
    low = next;
  }
}

}  // namespace tarn_test
