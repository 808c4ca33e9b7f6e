// SPDX-License-Identifier: Apache-2.0
// A console reporter that keeps the rates of all runs and can print their quotients: times of one
// machine mean little to another, quotients of one run do.
#pragma once

#include <map>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

class ratio_reporter : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run>& runs) override;

  // Median rate of a benchmark (values per second), or 0 if it did not run.
  double rate(const std::string& name) const;

  // One line: the quotient of two median rates, and the one that is asked for (0: none is).
  void print_ratio(const std::string& of, const std::string& to, double asked) const;

 private:
  std::map<std::string, std::vector<double>> rates_;
};
