// SPDX-License-Identifier: Apache-2.0
// The end of a process right after a call that is not waited for: it comes when the results are
// there and have been told of, whatever way it comes.
#include <cstdlib>
#include <string>

#include <gtest/gtest.h>

#include "tests/core/child_process.hpp"

namespace {

using core_test::outcome;

outcome end_by(const std::string& way) {
  // Taken from the environment by those who run children.
  return core_test::run_child({way}, {"LD_LIBRARY_PATH=" TARN_OMPTARGET_FOLDER});
}

const std::string told = "told, the results are there\n";
const std::string end = "a static object ends\n";

void expect_end(const std::string& way, const std::string& said) {
  // Several times, since two threads race for the end.
  for (int round = 0; round < 5; ++round) {
    const outcome child = end_by(way);
    EXPECT_EQ(child.exit_code, 0) << child.err;
    EXPECT_EQ(child.out, said);
    EXPECT_EQ(child.err, "");
  }
}

TEST(offload_ending, waits_when_main_returns) {
  expect_end("return", told + end);
}
TEST(offload_ending, waits_when_main_calls_exit) {
  expect_end("exit", told + end);
}
TEST(offload_ending, does_not_hang_when_the_completion_function_calls_exit) {
  expect_end("exit_when_told", told + end);
}

TEST(offload_ending, of_a_forked_child_does_not_wait_for_its_parents_call) {
  for (int round = 0; round < 5; ++round) {
    const outcome child = end_by("fork");
    EXPECT_EQ(child.exit_code, 0) << child.err;
    EXPECT_EQ(core_test::lines_with(child.out, "the child has ended"), 1) << child.out;
    EXPECT_EQ(core_test::lines_with(child.out, "told, the results are there"), 1) << child.out;
    EXPECT_EQ(core_test::lines_with(child.out, "a static object ends"), 2) << child.out;
  }
}

}  // namespace
