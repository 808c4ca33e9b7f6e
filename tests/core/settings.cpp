// SPDX-License-Identifier: Apache-2.0
// Environment variables: defaults, values, malformed values reported once, and the threads.
#include <sched.h>
#include <string>

#include <gtest/gtest.h>

#include "child_process.hpp"
#include "tarn_serv.h"

namespace {

using core_test::lines_with;
using core_test::run_child;

int cpus_of_this_process() {
  cpu_set_t cpus;
  return ::sched_getaffinity(0, sizeof cpus, &cpus) == 0 ? CPU_COUNT(&cpus) : -1;
}

TEST(CoreSettings, DefaultsWithoutVariables) {
  const auto child = run_child({"values"});
  EXPECT_EQ(child.out, "mode 0\nmode 0\nfile ''\ndynamic 1\nthreads " +
                           std::to_string(cpus_of_this_process()) + "\n");
  EXPECT_EQ(child.err, "");
}

TEST(CoreSettings, ValuesAreTaken) {
  const auto child = run_child({"values"}, {"TARN_VERBOSE=2", "TARN_VERBOSE_OUTPUT_FILE=a b.txt",
                                            "TARN_DYNAMIC=0", "TARN_NUM_THREADS=3"});
  EXPECT_EQ(child.out, "mode 2\nmode 2\nfile 'a b.txt'\ndynamic 0\nthreads 3\n");
  EXPECT_EQ(child.err, "");
}

TEST(CoreSettings, EmptyValuesAreDefaults) {
  const auto child = run_child({"values"}, {"TARN_VERBOSE=", "TARN_VERBOSE_OUTPUT_FILE="});
  EXPECT_EQ(lines_with(child.out, "mode 0"), 2);
  EXPECT_EQ(child.err, "");
}

TEST(CoreSettings, MalformedValuesAreReportedOnceAndDefaultsTaken) {
  for (const std::string bad : {"3", "-1", "yes", "1x", " 1", "99999999999"}) {
    const auto child = run_child({"values"}, {"TARN_VERBOSE=" + bad});
    EXPECT_EQ(lines_with(child.out, "mode 0"), 2) << bad;
    EXPECT_EQ(lines_with(child.err, "TARN_VERBOSE is set to '" + bad + "'"), 1) << child.err;
  }
  const auto threads = run_child({"values"}, {"TARN_NUM_THREADS=0", "TARN_DYNAMIC=2"});
  EXPECT_EQ(lines_with(threads.out, "threads " + std::to_string(cpus_of_this_process())), 1);
  EXPECT_EQ(lines_with(threads.out, "dynamic 1"), 1);
  EXPECT_EQ(lines_with(threads.err, "TARN_NUM_THREADS"), 1);
  EXPECT_EQ(lines_with(threads.err, "TARN_DYNAMIC"), 1);
}

TEST(CoreSettings, ThreadsCanBeSetAndBadNumbersAreReported) {
  const int before = tarn_serv_get_max_threads();
  EXPECT_GE(before, 1);
  tarn_serv_set_max_threads(5);
  EXPECT_EQ(tarn_serv_get_max_threads(), 5);
  testing::internal::CaptureStderr();
  tarn_serv_set_max_threads(0);
  EXPECT_EQ(lines_with(testing::internal::GetCapturedStderr(), "tarn_serv_set_max_threads"), 1);
  EXPECT_EQ(tarn_serv_get_max_threads(), 5);
  tarn_serv_set_max_threads(before);
}

TEST(CoreSettings, TheTableNamesEveryVariable) {
  testing::internal::CaptureStdout();
  tarn_serv_print_settings(0);
  const std::string table = testing::internal::GetCapturedStdout();
  for (const char* const name :
       {"`TARN_VERBOSE`", "`TARN_VERBOSE_OUTPUT_FILE`", "`TARN_DYNAMIC`", "`TARN_NUM_THREADS`"}) {
    EXPECT_EQ(lines_with(table, name), 1) << name;
  }
}

}  // namespace
