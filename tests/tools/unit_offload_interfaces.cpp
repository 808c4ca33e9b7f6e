// SPDX-License-Identifier: Apache-2.0
// The C header of the offload entries and the Fortran modules that are checked in: what their maker
// makes of the present lists, and for the host library all that its C header has.
#include <fstream>
#include <iterator>
#include <set>
#include <sstream>
#include <stdexcept>
#include <string>

#include <gtest/gtest.h>

#include "interfaces.hpp"

namespace {

using namespace tarn::interfaces;

std::string contents(const std::string& file) {
  std::ostringstream text;
  text << std::ifstream(std::string(TARN_TREE "/") + file).rdbuf();
  return text.str();
}

constexpr const char* in_names = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_";

/// The names that follow `mark` in the text, each with `head` in front of it.
std::set<std::string> names_after(const std::string& mark, const std::string& text,
                                  const std::string& head = "") {
  std::set<std::string> found;
  for (std::size_t at = text.find(mark); at != std::string::npos; at = text.find(mark, at + 1)) {
    const std::size_t begin = at + mark.size();
    found.insert(head + text.substr(begin, text.find_first_not_of(in_names, begin) - begin));
  }
  return found;
}

void expect_kept(void (*write)(std::ostream&), const std::string& file) {
  std::ostringstream made;
  write(made);
  EXPECT_FALSE(made.str().empty());
  EXPECT_EQ(made.str(), contents(file)) << "./run tables makes it anew";
}

TEST(offload_interfaces, are_those_of_the_lists) {
  expect_kept(write_c_header, "offload/include/tarn_rvx_offload.h");
  expect_kept(write_offload_module, "offload/fortran/tarn_rvx_offload.f90");
  expect_kept(write_host_module, "statistics/fortran/tarn_rvx.f90");
}

TEST(offload_interfaces, the_module_of_the_host_has_what_its_header_has) {
  const std::string header = contents("statistics/include/tarn_rvx.h");
  const std::string module = contents("statistics/fortran/tarn_rvx.f90");
  const auto functions = names_after("RVX_API int ", header);
  EXPECT_EQ(functions.size(), 50u);
  EXPECT_EQ(names_after("bind(C, name=\"", module), functions);
  std::set<std::string> constants;
  for (const char* family : {"RVX_BRNG_", "RVX_RNG_METHOD_", "RVX_STATUS_"}) {
    constants.merge(names_after(std::string("#define ") + family, header, family));
  }
  EXPECT_EQ(constants.size(), 37u);
  EXPECT_EQ(names_after("parameter :: ", module), constants);
}

TEST(offload_interfaces, the_module_has_the_entries_by_address) {
  std::set<std::string> entries =
      names_after("TARN_RVX_OFFLOAD_API int ", contents("offload/include/tarn_rvx_offload.h"));
  EXPECT_EQ(entries.size(), 152u);
  for (auto at = entries.begin(); at != entries.end();) {
    at = at->find("Rng") != std::string::npos ? entries.erase(at) : std::next(at);
  }
  EXPECT_EQ(entries.size(), 76u);
  const std::string module = contents("offload/fortran/tarn_rvx_offload.f90");
  EXPECT_EQ(names_after("bind(C, name=\"", module), entries);
  EXPECT_EQ(names_after("\n  interface tarn_rvx_offload_", module).size(), 38u);
}

TEST(offload_interfaces, the_modules_keep_to_the_lengths_of_the_standard) {
  for (const char* file :
       {"offload/fortran/tarn_rvx_offload.f90", "statistics/fortran/tarn_rvx.f90"}) {
    std::istringstream lines(contents(file));
    int count = 0;
    for (std::string line; std::getline(lines, line); ++count) {
      EXPECT_LE(line.size(), 132u) << line;
    }
    EXPECT_GT(count, 100) << file;
    for (const std::string& name : names_after(" function ", contents(file))) {
      EXPECT_LE(name.size(), 63u) << name;
    }
  }
}

TEST(offload_interfaces, parameters_are_a_type_and_a_name) {
  const std::vector<parameter> read = read_parameters("std::int32_t k, const float *x, Int l");
  ASSERT_EQ(read.size(), 3u);
  EXPECT_EQ(read[0].type, "int32_t");
  EXPECT_EQ(read[0].name, "k");
  EXPECT_FALSE(read[0].array);
  EXPECT_EQ(read[1].type, "float");
  EXPECT_EQ(read[1].name, "x");
  EXPECT_TRUE(read[1].array);
  EXPECT_EQ(read[2].type, integer_of_entry);
  EXPECT_TRUE(read_parameters("").empty());
  for (const char* bad : {"float", "float x y", "float* r", "const float x", "float x,, float y"}) {
    EXPECT_THROW(read_parameters(bad), std::invalid_argument) << bad;
  }
}

}  // namespace
