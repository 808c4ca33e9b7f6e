// SPDX-License-Identifier: Apache-2.0
// Every case gives the same bits under every SIMD target: hashes printed by a program of its own
// (print_routines.cpp), which is run under each.
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "../core/child_process.hpp"

namespace {

struct print {
  std::vector<std::string> cases;
  std::string target;
};

print run_under(const std::string& target) {
  const auto done = core_test::run_child({}, {"TARN_SIMD_TARGET=" + target});
  EXPECT_EQ(done.exit_code, 0) << done.err;
  print p;
  std::istringstream lines(done.out);
  for (std::string line; std::getline(lines, line);) {
    if (line.rfind("target ", 0) == 0)
      p.target = line.substr(7);
    else
      p.cases.push_back(line);
  }
  return p;
}

class targets : public testing::TestWithParam<const char*> {};

TEST_P(targets, give_the_bits_of_plain_code) {
  static const print plain = run_under("SCALAR");
  ASSERT_EQ(plain.target, "SCALAR");
  ASSERT_GE(plain.cases.size(), 500u);
  const print p = run_under(GetParam());
  if (p.target != GetParam())
    GTEST_SKIP() << "this processor has no " << GetParam();
  ASSERT_EQ(p.cases.size(), plain.cases.size());
  for (std::size_t i = 0; i < plain.cases.size(); ++i) {
    EXPECT_NE(plain.cases[i].find(": 0 "), std::string::npos) << "status of " << plain.cases[i];
    EXPECT_EQ(p.cases[i], plain.cases[i]);
  }
}

std::string name_of(const testing::TestParamInfo<const char*>& info) {
  return info.param;
}
INSTANTIATE_TEST_SUITE_P(each, targets, testing::Values("AVX3", "AVX2", "SSE4", "SSSE3"), name_of);

}  // namespace
