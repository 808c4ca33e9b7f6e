// SPDX-License-Identifier: Apache-2.0
// Quotients of median rates.
#include "ratios.hpp"

#include <algorithm>
#include <cstdio>

void ratio_reporter::ReportRuns(const std::vector<Run>& runs) {
  for (const Run& run : runs) {
    const auto rate = run.counters.find("items_per_second");
    if (run.run_type == Run::RT_Iteration && rate != run.counters.end())
      rates_[run.run_name.function_name].push_back(rate->second);
  }
  ConsoleReporter::ReportRuns(runs);
}

double ratio_reporter::rate(const std::string& name) const {
  const auto found = rates_.find(name);
  if (found == rates_.end())
    return 0;
  std::vector<double> sorted = found->second;
  std::sort(sorted.begin(), sorted.end());
  return sorted[sorted.size() / 2];
}

void ratio_reporter::print_ratio(const std::string& of, const std::string& to, double asked) const {
  if (rate(of) == 0 || rate(to) == 0)
    return;
  const double ratio = rate(of) / rate(to);
  std::printf("%-32s / %-32s %7.2f", of.c_str(), to.c_str(), ratio);
  if (asked != 0)
    std::printf("   asked: %.1f   %s", asked, ratio >= asked ? "met" : "MISSED");
  std::printf("\n");
}
