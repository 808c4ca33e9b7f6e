// SPDX-License-Identifier: Apache-2.0
// Numbered messages and formatted printing: the right words on the right channel.
#include <cstdio>
#include <string>

#include <gtest/gtest.h>

#include "child_process.hpp"
#include "tarn_serv.h"

namespace {

template <typename Print>
std::string printed(int channel, Print print) {
  const bool normal = channel == 0;
  normal ? testing::internal::CaptureStdout() : testing::internal::CaptureStderr();
  print();
  return normal ? testing::internal::GetCapturedStdout() : testing::internal::GetCapturedStderr();
}

TEST(CoreMessages, EachKnownNumberHasItsText) {
  EXPECT_EQ(printed(0, [] { tarn_serv_print(0, 3, 1, "'zeInit'"); }),
            "Tarn: no loaded library has the function 'zeInit'\n");
  EXPECT_EQ(printed(1, [] { tarn_serv_print(1, 771, 0); }),
            "Tarn: the statistics library cannot be loaded\n");
  EXPECT_EQ(printed(1, [] { tarn_serv_print(1, 772, 1, "_rvxsRngUniform"); }),
            "Tarn: the statistics library has no entry named _rvxsRngUniform\n");
  EXPECT_EQ(printed(0, [] { tarn_serv_print(0, 1449, 0); }),
            "Tarn: more clean-up functions were registered than there is room for\n");
}

TEST(CoreMessages, UnknownNumbersAndWrongCountsNameTheNumber) {
  EXPECT_NE(printed(0, [] { tarn_serv_print(0, 4711, 0); }).find("4711"), std::string::npos);
  const std::string line = printed(1, [] { tarn_serv_print(1, 772, 0); });
  EXPECT_NE(line.find("772"), std::string::npos);
  EXPECT_EQ(line.find("no entry"), std::string::npos);
}

TEST(CoreMessages, ChannelsAreTheStandardStreams) {
  const auto normal = core_test::run_child({"messages", "0"});
  EXPECT_EQ(core_test::lines_with(normal.out, "'name'"), 1);
  EXPECT_EQ(normal.err, "");
  const auto warning = core_test::run_child({"messages", "1"});
  EXPECT_EQ(core_test::lines_with(warning.err, "'name'"), 1);
  EXPECT_EQ(warning.out, "");
}

TEST(CoreMessages, FormattedPrintingTakesValues) {
  EXPECT_EQ(printed(0, [] { tarn_serv_format_print(0, "%s=%d\n", 2, "n", 5); }), "n=5\n");
  EXPECT_EQ(printed(1, [] { tarn_serv_format_print(1, "100%%\n", 0); }), "100%\n");
  const core_test::scratch_folder folder;
  const std::string path = folder / "lines";
  std::FILE* const file = std::fopen(path.c_str(), "w");
  ASSERT_NE(file, nullptr);
  tarn_serv_file_format_print(file, "%d %s\n", 2, 3, "x");
  std::fclose(file);
  EXPECT_EQ(core_test::contents(path), "3 x\n");
}

// What the callback of the next test has received.
std::string received_name;
int received_position = 0;

void receive(const char* name, const int* position, int length) {
  received_name.assign(name, static_cast<std::size_t>(length));
  received_position = *position;
}

TEST(CoreErrors, ReportsGoToStandardErrorUnlessACallbackIsSet) {
  const int position = 4;
  const auto report = [&position] { tarn_serv_xerbla("rvxNewStreamXYZ", &position, 12); };
  const std::string line = printed(1, report);
  EXPECT_EQ(core_test::lines_with(line, "rvxNewStream "), 1) << line;
  EXPECT_EQ(core_test::lines_with(line, "parameter 4"), 1) << line;

  EXPECT_EQ(tarn_serv_set_xerbla_interface(reinterpret_cast<void*>(&receive), 0), nullptr);
  tarn_serv_set_xerbla_interface(nullptr, 0);  // Announces a report: the callback stays.
  EXPECT_EQ(printed(1, report), "");
  EXPECT_EQ(received_name, "rvxNewStream");
  EXPECT_EQ(received_position, 4);

  EXPECT_EQ(tarn_serv_set_xerbla_interface(nullptr, 1), reinterpret_cast<void*>(&receive));
  received_position = 0;
  EXPECT_NE(printed(1, report), "");
  EXPECT_EQ(received_position, 0);
}

}  // namespace
