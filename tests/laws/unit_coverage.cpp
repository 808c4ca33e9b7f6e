// SPDX-License-Identifier: Apache-2.0
// The cases against the list of routines: every routine, each of its methods, and at least twelve
// sets of parameters where there are parameters.
#include <map>
#include <set>
#include <string>

#include <gtest/gtest.h>

#include "edge_cases.hpp"
#include "specimen.hpp"

namespace {

constexpr std::int64_t flag = RVX_RNG_METHOD_ACCURACY_FLAG;

// Methods by the name that the list gives their bits.
const std::map<std::string, std::set<std::int64_t>> methods_of = {
    {"any_method", {0}},
    {"accuracy_methods", {0, flag}},
    {"gaussian_methods", {0, 1, 2}},
    {"lognormal_methods", {0, 1, flag, flag | 1}}};

struct cover {
  std::set<std::int64_t> methods;
  std::set<std::string> parameters;
};

std::map<std::string, cover> covered() {
  std::map<std::string, cover> all;
  for (const laws::specimen& s : laws::every_case()) {
    all[s.routine].methods.insert(s.method);
    all[s.routine].parameters.insert(s.parameters);
  }
  return all;
}

void expect_covered(const std::string& name, const std::set<std::int64_t>& methods,
                    bool has_parameters) {
  const auto all = covered();
  const auto found = all.find(name);
  ASSERT_NE(found, all.end()) << name << " has no case";
  EXPECT_EQ(found->second.methods, methods) << name;
  EXPECT_GE(found->second.parameters.size(), has_parameters ? 12u : 1u) << name;
}

TEST(coverage, every_routine_and_method_has_cases) {
  std::size_t routines = 0;
#define TARN_ROUTINE(name, value, methods, width, parameters, arguments, check)     \
  expect_covered(#name,                                                             \
                 std::string(#name) == "iRngPoisson" ? std::set<std::int64_t>{0, 1} \
                                                     : methods_of.at(#methods),     \
                 std::string(#arguments) != "()");                                  \
  ++routines;
#include "statistics/common/routines.def"
  expect_covered("iRngPoissonV", {0}, true);
  EXPECT_EQ(covered().size(), routines + 1) << "cases of routines that the list has not";
}

TEST(coverage, every_routine_with_parameters_has_edge_cases) {
  std::set<std::string> at_edges, with_parameters;
  for (const laws::specimen& s : laws::edge_cases())
    at_edges.insert(s.routine);
  for (const laws::specimen& s : laws::every_case())
    if (!s.parameters.empty())
      with_parameters.insert(s.routine);
  EXPECT_EQ(at_edges, with_parameters);
}

}  // namespace
