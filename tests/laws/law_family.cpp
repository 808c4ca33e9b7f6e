// SPDX-License-Identifier: Apache-2.0
// The routines against their laws, family by family: every case with a seed of its own on
// philox4x32x10.
// TARN_LONG_TESTS=1 draws fifty times as many values.
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "critical.hpp"
#include "sampling.hpp"
#include "specimen.hpp"

namespace {

using laws::specimen;

constexpr std::size_t short_form = 200'000, longer = 50;

std::size_t results_of(const specimen& s) {
  const char* wish = std::getenv("TARN_LONG_TESTS");
  const std::size_t n =
      wish != nullptr && std::string(wish) == "1" ? short_form * longer : short_form;
  // Of wide results fewer, but not so few that the tests lose their power.
  return std::max(n / s.width, n / 5);
}

class families : public testing::TestWithParam<specimen> {};

TEST_P(families, follow_their_laws) {
  const std::size_t n = results_of(GetParam());
  laws::philox stream(laws::seed_of(GetParam().name()));
  for (const laws::judged_view& view : laws::judge(GetParam(), stream, n))
    EXPECT_EQ(laws::failures(view.findings), "")
        << GetParam().name() << ", view " << view.number << ", " << n << " results";
}

#define TARN_FAMILY(name)                                                           \
  INSTANTIATE_TEST_SUITE_P(name, families, testing::ValuesIn(laws::name##_cases()), \
                           laws::specimen_name);
#include "families.def"

class within_budget : public testing::Environment {
  void TearDown() override { EXPECT_LE(laws::tests_made(), laws::tests_of_a_program); }
};
const testing::Environment* const budget =
    testing::AddGlobalTestEnvironment(new within_budget);  // gtest owns it

}  // namespace
