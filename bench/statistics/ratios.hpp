// SPDX-License-Identifier: Apache-2.0
// A console reporter that keeps the medians and can print the quotients of rates: times of one
// machine mean little to another, quotients of one run do.
#pragma once

#include <map>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

// Takes the command line for the benchmarks, whose runs are interleaved: that spreads the noise of
// a shared machine over all of them alike. False if it does not understand an argument.
bool initialize(int argc, char** argv);

class ratio_reporter : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run>& runs) override;

  // Median rate of a benchmark (values per second), or 0 if it did not run.
  double rate(const std::string& name) const;

  // Notes a rate that was measured elsewhere.
  void set_rate(const std::string& name, double values_per_second) {
    rates_[name] = values_per_second;
  }

  // One line: the median time of one iteration and whether it is below `limit` (nanoseconds).
  void print_time(const std::string& of, double limit) const;

  // One line: the quotient of two median rates, and whether it is what is asked for (0: nothing
  // is). Reaching the rate of `ceiling` will do as well.
  void print_ratio(const std::string& of, const std::string& to, double asked = 0,
                   const std::string& ceiling = "") const;

 private:
  std::map<std::string, double> rates_, nanoseconds_;
};
