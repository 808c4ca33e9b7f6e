// SPDX-License-Identifier: Apache-2.0
// Verbose lines: the banner at most once, whole lines from many threads, and the output file.
#include <string>

#include <gtest/gtest.h>

#include "child_process.hpp"

namespace {

using core_test::contents;
using core_test::lines_with;
using core_test::run_child;

TEST(CoreVerbose, OffPrintsNothing) {
  const auto child = run_child({"lines"});
  EXPECT_EQ(child.out, "");
  EXPECT_EQ(child.err, "");
}

TEST(CoreVerbose, TheBannerComesOnceAndFirst) {
  const auto child = run_child({"lines"}, {"TARN_VERBOSE=1", "TARN_NUM_THREADS=3"});
  EXPECT_EQ(child.out.rfind("TARN_VERBOSE Tarn RNG ", 0), 0U) << child.out;
  EXPECT_EQ(lines_with(child.out, "processor: "), 1);
  EXPECT_EQ(lines_with(child.out, "threads: 3"), 1);
  EXPECT_EQ(lines_with(child.out, "interface: SYCL"), 1);
  EXPECT_EQ(lines_with(child.out, "TARN_VERBOSE first(1) 500.00ms"), 1);
  EXPECT_EQ(lines_with(child.out, "TARN_VERBOSE second(2) N/A"), 1);
  EXPECT_EQ(lines_with(child.out, ""), 3);
  EXPECT_EQ(child.err, "");
}

TEST(CoreVerbose, LinesOfThreadsStayWhole) {
  const auto child = run_child({"threads"}, {"TARN_VERBOSE=1"});
  EXPECT_EQ(lines_with(child.out, ""), 8 * 50 + 1);
  EXPECT_EQ(lines_with(child.out, "TARN_VERBOSE line of a thread 500.00us"), 8 * 50);
  EXPECT_EQ(child.out.rfind("TARN_VERBOSE Tarn RNG ", 0), 0U);
  EXPECT_EQ(lines_with(child.out, "Tarn RNG"), 1);
}

TEST(CoreVerbose, TheFileIsAppendedTo) {
  const core_test::scratch_folder folder;
  const std::string file = folder / "verbose.txt";
  const std::string setting = "TARN_VERBOSE_OUTPUT_FILE=" + file;
  for (int runs = 1; runs <= 2; ++runs) {
    const auto child = run_child({"lines"}, {"TARN_VERBOSE=1", setting});
    EXPECT_EQ(child.out, "");
    EXPECT_EQ(child.err, "");
    EXPECT_EQ(lines_with(contents(file), ""), 3 * runs);
    EXPECT_EQ(lines_with(contents(file), "Tarn RNG"), runs);
  }
}

TEST(CoreVerbose, AnUnwritableFileIsWarnedAboutOnEveryLine) {
  const auto child =
      run_child({"lines"}, {"TARN_VERBOSE=1", "TARN_VERBOSE_OUTPUT_FILE=/no/such/folder/file"});
  EXPECT_EQ(lines_with(child.out, "TARN_VERBOSE"), 3);
  EXPECT_EQ(
      lines_with(child.err, "TARN_VERBOSE WARNING: unable to open output file. Print to STDOUT"),
      3);
}

}  // namespace
