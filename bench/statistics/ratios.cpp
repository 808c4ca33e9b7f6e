// SPDX-License-Identifier: Apache-2.0
// Quotients of median rates.
#include "ratios.hpp"

#include <cstdio>

void ratio_reporter::ReportRuns(const std::vector<Run>& runs) {
  for (const Run& run : runs) {
    const auto rate = run.counters.find("bytes_per_second");
    if (run.aggregate_name == "median" && rate != run.counters.end())
      rates_[run.run_name.function_name] = rate->second;
  }
  ConsoleReporter::ReportRuns(runs);
}

double ratio_reporter::rate(const std::string& name) const {
  const auto found = rates_.find(name);
  return found == rates_.end() ? 0 : found->second;
}

void ratio_reporter::print_ratio(const std::string& of, const std::string& to, double asked,
                                 const std::string& ceiling) const {
  if (rate(of) == 0 || rate(to) == 0)
    return;
  const double ratio = rate(of) / rate(to);
  std::printf("%-32s / %-32s %7.2f", of.c_str(), to.c_str(), ratio);
  if (asked != 0) {
    const bool at_ceiling = !ceiling.empty() && rate(of) >= rate(ceiling);
    const char* verdict = ratio >= asked ? "met" : at_ceiling ? "met: at the ceiling" : "MISSED";
    std::printf("   asked: %.1f   %s", asked, verdict);
  }
  std::printf("\n");
}
