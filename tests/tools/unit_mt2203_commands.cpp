// SPDX-License-Identifier: Apache-2.0
// What mt2203_table does with files and arguments: rows come out as they are checked in whichever
// way they are made, and a run that was cut off goes on where it stood.
#include <fstream>

#include <gtest/gtest.h>

#include "../core/child_process.hpp"
#include "mt2203/generate.hpp"
#include "mt2203/table_file.hpp"

namespace {

using namespace tarn::mt2203;
using core_test::contents;
using core_test::run_child;
using core_test::scratch_folder;

void write_file(const std::string& path, const std::string& text) {
  std::ofstream(path) << text;
}

std::string checked_in_rows(std::size_t first, std::size_t last) {
  const std::vector<parameters> rows = read_table(TARN_MT2203_TABLE);
  std::string text;
  for (std::size_t id = first; id <= last; ++id)
    text += row_text(rows.at(id));
  return text;
}

TEST(mt2203_commands, rows_are_made_again_as_they_are) {
  const auto made = run_child({"--generate", "100", "102"});
  EXPECT_EQ(made.exit_code, 0);
  EXPECT_EQ(made.out, checked_in_rows(100, 102));
}

TEST(mt2203_commands, rows_do_not_depend_on_the_processor) {
  const auto made = run_child({"--portable", "--generate", "6023", "6023"});
  EXPECT_EQ(made.exit_code, 0);
  EXPECT_EQ(made.out, checked_in_rows(6023, 6023));
}

// The part file lacks three rows, one of which was cut off in the middle, and is out of order.
TEST(mt2203_commands, a_stopped_run_goes_on) {
  const scratch_folder folder;
  const std::string part = folder / "table.inc.part";
  const std::string cut_off = checked_in_rows(17, 17).substr(0, 20);
  write_file(part, table_header() + checked_in_rows(3000, 6022) + checked_in_rows(18, 2998) +
                       checked_in_rows(0, 16) + cut_off);
  const auto made = run_child({"--generate-file", folder / "table.inc", "--threads", "2"});
  EXPECT_EQ(made.exit_code, 0) << made.err;
  EXPECT_EQ(core_test::lines_with(made.err, "6024 of 6024 members"), 1) << made.err;
  EXPECT_EQ(contents(folder / "table.inc"), contents(TARN_MT2203_TABLE));
  EXPECT_FALSE(std::ifstream(part)) << "the part file is still there";
}

TEST(unfinished_table, is_taken_as_far_as_it_can_be_trusted) {
  const scratch_folder folder;
  const std::string path = folder / "part";
  EXPECT_TRUE(read_unfinished_table(path).empty());
  write_file(path, table_header() + "{0x80000001, 0x00000080, 0x00008000},\n{0x8000");
  EXPECT_EQ(read_unfinished_table(path).size(), 1u);
  // A row that looks whole is not, if its end of line is missing.
  write_file(path, table_header() + "{0x80000001, 0x00000080, 0x00008000},");
  EXPECT_TRUE(read_unfinished_table(path).empty());
  // Other bounds, other rows: nothing of it can be used.
  write_file(path, "// made otherwise\n{0x80000001, 0x00000080, 0x00008000},\n");
  EXPECT_TRUE(read_unfinished_table(path).empty());
}

TEST(table, is_read_as_it_was_written) {
  const scratch_folder folder;
  const std::vector<parameters> rows{{0x80000000, 0x80, 0x8000}, {0xFFFF0001, 0xFFFFFF80, 0}};
  write_table(folder / "table", rows);
  EXPECT_EQ(read_table(folder / "table"), rows);
  EXPECT_EQ(contents(folder / "table"), table_header() + row_text(rows[0]) + row_text(rows[1]));
  write_file(folder / "table", row_text(rows[0]) + "{0x80000001, 0x00000080},\n");
  EXPECT_THROW(read_table(folder / "table"), std::runtime_error);
  EXPECT_THROW(read_table(folder / "no such file"), std::runtime_error);
  EXPECT_THROW(write_table(folder / "no such folder/table", rows), std::runtime_error);
}

TEST(mt2203_commands, verify_accepts_the_table_and_refuses_a_spoilt_one) {
  EXPECT_EQ(run_child({"--verify", TARN_MT2203_TABLE, "40", "49"}).exit_code, 0);
  const auto twice = run_child({"--verify", TARN_MT2203_TABLE, "50", "53", "--second-method"});
  EXPECT_EQ(twice.exit_code, 0) << twice.err;
  EXPECT_EQ(core_test::lines_with(twice.out, "4 rows hold"), 1) << twice.out;

  const scratch_folder folder;
  const std::vector<parameters> rows = read_table(TARN_MT2203_TABLE);
  const auto faults_with = [&](std::size_t id, const parameters& row, const char* said) {
    std::vector<parameters> spoilt = rows;
    spoilt.at(id) = row;
    write_table(folder / "spoilt", spoilt);
    const auto found = run_child({"--verify", folder / "spoilt", "0", "9", "--second-method"});
    EXPECT_EQ(found.exit_code, 1) << said;
    return core_test::lines_with(found.err, "row " + std::to_string(id) + ": " + said);
  };
  const parameters& row = rows.at(5);
  const parameters other_period{row.a ^ 0x00010000, row.b, row.c};
  EXPECT_EQ(faults_with(5, other_period, "the characteristic polynomial is reducible"), 1);
  EXPECT_EQ(faults_with(5, other_period, "inversive decimation does not come back"), 1);
  EXPECT_EQ(faults_with(5, rows.at(6), "the low 16 bits are not the id"), 1);
  EXPECT_EQ(faults_with(5, {row.a, 0, row.c}, "the equidistribution misses a bound"), 1);
  EXPECT_EQ(faults_with(5, {row.a, row.b | 1, row.c}, "a mask bit without effect"), 1);

  write_table(folder / "short", {rows.begin(), rows.end() - 1});
  EXPECT_EQ(run_child({"--verify", folder / "short"}).exit_code, 1);
  EXPECT_EQ(run_child({"--verify", folder / "missing"}).exit_code, 1);
}

TEST(mt2203_commands, bad_arguments_give_the_usage_and_status_2) {
  const std::vector<std::string> bad[] = {
      {},
      {"--help"},
      {"--generate"},
      {"--generate", "1"},
      {"--generate", "2", "1"},
      {"--generate", "0", "6024"},
      {"--generate", "0", "1x"},
      {"--generate", "-1", "1"},
      {"--generate", "0", "0", "0"},
      {"--generate-file"},
      {"--generate-file", "no such folder/t", "--threads"},
      {"--generate-file", "no such folder/t", "--threads", "0"},
      {"--generate-file", "no such folder/t", "--thread", "1"},
      {"--verify"},
      {"--verify", TARN_MT2203_TABLE, "1"},
      {"--verify", TARN_MT2203_TABLE, "1", "6024"},
  };
  for (const auto& arguments : bad) {
    const auto said = run_child(arguments);
    EXPECT_EQ(said.exit_code, 2) << testing::PrintToString(arguments);
    EXPECT_EQ(core_test::lines_with(said.err, "usage: mt2203_table"), 1);
    EXPECT_TRUE(said.out.empty());
  }
  EXPECT_EQ(run_child({"--generate-file", "no such folder/t"}).exit_code, 1);
}

}  // namespace
