// SPDX-License-Identifier: Apache-2.0
// Quotients of median rates.
#include "ratios.hpp"

#include <cstdio>

bool initialize(int argc, char** argv) {
  std::vector<char*> arguments(argv, argv + argc);
  char interleaved[] = "--benchmark_enable_random_interleaving=true";
  arguments.insert(arguments.begin() + 1, interleaved);
  int count = static_cast<int>(arguments.size());
  benchmark::Initialize(&count, arguments.data());
  return !benchmark::ReportUnrecognizedArguments(count, arguments.data());
}

void ratio_reporter::ReportRuns(const std::vector<Run>& runs) {
  for (const Run& run : runs) {
    if (run.aggregate_name != "median")
      continue;
    const auto rate = run.counters.find("items_per_second");
    if (rate != run.counters.end())
      rates_[run.run_name.function_name] = rate->second;
    nanoseconds_[run.run_name.function_name] =
        run.GetAdjustedRealTime() * 1e9 / benchmark::GetTimeUnitMultiplier(run.time_unit);
  }
  ConsoleReporter::ReportRuns(runs);
}

double ratio_reporter::rate(const std::string& name) const {
  const auto found = rates_.find(name);
  return found == rates_.end() ? 0 : found->second;
}

void ratio_reporter::print_time(const std::string& of, double limit) const {
  const auto found = nanoseconds_.find(of);
  if (found != nanoseconds_.end())
    std::printf("%-32s %12.1f ns   asked: below %.0f ns   %s\n", of.c_str(), found->second, limit,
                found->second < limit ? "met" : "MISSED");
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
