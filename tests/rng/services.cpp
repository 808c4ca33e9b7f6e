// SPDX-License-Identifier: Apache-2.0
// Skips and leaps, of each engine that has them, on every kind of device that it has a road for.
#include <cstdint>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "every_engine.hpp"
#include "message.hpp"
#include "silence.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

template <typename Case>
class skips : public over_cases<Case> {
 protected:
  void SetUp() override {
    if (Case::on_gpu && std::is_same_v<typename Case::Engine, rng::mt19937>) {
      GTEST_SKIP() << "its skips are not seen after an odd number of calls: mt19937_objects.cpp";
    }
  }
};
TYPED_TEST_SUITE(skips, skipping_cases, case_name);

template <typename Case>
class list_skips : public over_cases<Case> {};
TYPED_TEST_SUITE(list_skips, list_skipping_cases, case_name);

template <typename Case>
class leaps : public over_cases<Case> {};
TYPED_TEST_SUITE(leaps, leaping_cases, case_name);

TEST(services, exist_for_as_many_engines_as_are_known_to_have_them) {
  EXPECT_EQ(on_cpu(every_case{}), 13);
  EXPECT_EQ(on_cpu(skipping_cases{}), 10);
  EXPECT_EQ(on_cpu(list_skipping_cases{}), 3);
  EXPECT_EQ(on_cpu(leaping_cases{}), 3);
}

TYPED_TEST(skips, equal_drawing) {
  for (const std::int64_t before : {0, 6}) {
    for (const std::int64_t count : {0, 1, 3, 4, 17, 1000, 2600}) {
      auto engine = TypeParam::make();
      next(engine, before);
      rng::skip_ahead(engine, static_cast<std::uint64_t>(count));
      ASSERT_EQ(next(engine, 30), serial<TypeParam>(before + count, 30))
          << "by " << count << " after " << before;
      rng::skip_ahead(engine, 5);
      ASSERT_EQ(next(engine, 3), serial<TypeParam>(before + count + 35, 3));
    }
  }
}

TYPED_TEST(skips, are_part_of_the_state_that_copies_take) {
  auto source = TypeParam::make();
  next(source, 2);
  rng::skip_ahead(source, 1001);
  auto copy = source;
  rng::skip_ahead(source, 1);
  EXPECT_EQ(next(copy, 9), serial<TypeParam>(1003, 9));
  EXPECT_EQ(next(source, 9), serial<TypeParam>(1004, 9));
}

// 2^64 + 5 words: a skip by 5, and two by 2^63.
TYPED_TEST(list_skips, are_by_a_number_in_64_bit_digits) {
  auto by_list = TypeParam::make();
  next(by_list, 3);
  auto by_numbers = by_list;
  rng::skip_ahead(by_list, {5, 1});
  rng::skip_ahead(by_numbers, 5);
  rng::skip_ahead(by_numbers, std::uint64_t{1} << 63);
  rng::skip_ahead(by_numbers, std::uint64_t{1} << 63);
  const auto far = next(by_list, 20);
  EXPECT_EQ(far, next(by_numbers, 20));
  EXPECT_NE(far, serial<TypeParam>(8, 20));
}

TYPED_TEST(list_skips, of_one_digit_equal_drawing) {
  auto engine = TypeParam::make();
  next(engine, 6);
  rng::skip_ahead(engine, {1000});
  EXPECT_EQ(next(engine, 9), serial<TypeParam>(1006, 9));
  rng::skip_ahead(engine, {2, 0, 0});
  EXPECT_EQ(next(engine, 9), serial<TypeParam>(1017, 9));
}

/// Every `stride`-th of the words from the sixth on, beginning with number `idx`.
template <typename Case>
std::vector<double> every(std::uint64_t idx, std::uint64_t stride, std::size_t n) {
  const auto all = serial<Case>(6, static_cast<std::int64_t>(stride * n));
  std::vector<double> kept;
  for (std::size_t i = 0; i < n; ++i) {
    kept.push_back(all[idx + i * stride]);
  }
  return kept;
}

TYPED_TEST(leaps, leave_every_so_many_words) {
  for (const std::uint64_t stride : {1u, 2u, 5u, 1000u}) {
    for (const std::uint64_t idx : {std::uint64_t{0}, stride / 2, stride - 1}) {
      auto engine = TypeParam::make();
      next(engine, 6);
      rng::leapfrog(engine, idx, stride);
      auto copy = engine;
      const auto expected = every<TypeParam>(idx, stride, 9);
      ASSERT_EQ(next(engine, 9), expected) << idx << " of " << stride;
      ASSERT_EQ(next(copy, 9), expected) << idx << " of " << stride;
    }
  }
}

TYPED_TEST(leaps, that_cannot_be_made_raise_an_empty_text) {
  const silence reports;
  auto engine = TypeParam::make();
  const std::string message = "kestrel::tarn::rng::leapfrog: computation error";
  const auto refusal = [&](std::uint64_t idx, std::uint64_t stride) {
    return message_of<tarn::computation_error>([&] { rng::leapfrog(engine, idx, stride); });
  };
  EXPECT_EQ(refusal(5, 5), message);
  EXPECT_EQ(refusal(0, 0), message);
  EXPECT_EQ(refusal(~std::uint64_t{0}, 5), message);
  EXPECT_EQ(next(engine, 4), serial<TypeParam>(0, 4));
}

TEST(quasi_random_skips, past_the_end_raise_an_empty_text) {
  const silence reports;
  rng::sobol engine(cpu_queue());
  EXPECT_EQ(
      message_of<tarn::computation_error>([&] { rng::skip_ahead(engine, std::uint64_t{1} << 40); }),
      "kestrel::tarn::rng::skip_ahead: computation error");
}

}  // namespace
