// SPDX-License-Identifier: Apache-2.0
// What is late in a process: calls made when it has done its waiting, and callbacks that never
// come. And the order at the end of a call, as verbose mode shows it.
#include <string>

#include <gtest/gtest.h>

#include "tests/core/child_process.hpp"

namespace {

using core_test::outcome;

// What calls in flight at the end of a process use is left to it on purpose.
const std::string leaks = "ASAN_OPTIONS=detect_leaks=0";
const std::string folders = "LD_LIBRARY_PATH=" TARN_OPENCL_EVENTS_FOLDER ":" TARN_OMPTARGET_FOLDER;

TEST(offload_late_calls, from_destructors_of_static_objects_are_served_before_they_return) {
  for (int round = 0; round < 5; ++round) {
    const outcome child = core_test::run_child({}, {folders, leaks});
    EXPECT_EQ(child.exit_code, 0) << child.err;
    EXPECT_EQ(child.out,
              "told, the results are there\na static object ends\ntold, the results are there\n"
              "the late call is served\nand was told of before it returned\n");
    EXPECT_EQ(child.err, "");
  }
}

// The engine of a call has a stream of its own, whose end is reported like that of any other. The
// program deletes none of its own.
TEST(offload_late_calls, are_told_of_when_the_generator_is_gone) {
  const outcome child = core_test::run_child({}, {folders, leaks, "TARN_VERBOSE=1"});
  ASSERT_EQ(child.exit_code, 0) << child.err;
  EXPECT_EQ(core_test::lines_with(child.out, "rvxDeleteStream("), 3) << child.out;
  std::size_t from = child.out.find("rvxDeleteStream(");  // of the call that was waited for
  for (int call = 0; call < 2; ++call) {
    const std::size_t gone = child.out.find("rvxDeleteStream(", from + 1);
    const std::size_t told = child.out.find("told, the results are there", from + 1);
    ASSERT_NE(told, std::string::npos) << child.out;
    EXPECT_LT(gone, told) << child.out;
    from = told;
  }
}

TEST(offload_late_calls, do_not_hold_the_process_for_callbacks_that_never_come) {
  for (const char* const way : {"pending", "error"}) {
    const outcome child = core_test::run(TARN_PENDING_CHILD, {way}, {folders, leaks});
    EXPECT_EQ(child.exit_code, 0) << way << ": " << child.err;
    EXPECT_EQ(child.out, "main ends\n") << way;
  }
}

}  // namespace
