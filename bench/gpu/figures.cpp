// SPDX-License-Identifier: Apache-2.0
// Medians, quartiles and the table.
#include "figures.hpp"

#include <algorithm>
#include <cstdio>

namespace gpu_bench {
namespace {

// The element of rank q (n - 1), rounded: of 21 values the sixth and the sixteenth.
double quantile(std::vector<double> values, double q) {
  const auto rank = static_cast<std::ptrdiff_t>(q * static_cast<double>(values.size() - 1) + 0.5);
  std::nth_element(values.begin(), values.begin() + rank, values.end());
  return values[static_cast<std::size_t>(rank)];
}

void print_ratio(double ratio, double asked) {
  std::printf(" %6.2f ", ratio);
  if (asked == 0)
    std::printf("%-17s", "");
  else
    std::printf("(%.2f asked, %s)", asked, ratio >= asked ? "met" : "MISSED");
}

}  // namespace

void take_quartiles(benchmark::internal::Benchmark* of) {
  of->ComputeStatistics("first_quartile",
                        [](const std::vector<double>& v) { return quantile(v, 0.25); })
      ->ComputeStatistics("third_quartile",
                          [](const std::vector<double>& v) { return quantile(v, 0.75); })
      ->DisplayAggregatesOnly();
}

bool figures::ReportContext(const Context&) {
  return true;
}

void figures::ReportRuns(const std::vector<Run>& runs) {
  for (const Run& run : runs) {
    const std::string& name = run.run_name.function_name;
    if (run.error_occurred)
      continue;  // the road has said it
    const auto rate = run.counters.find("items_per_second");
    if (rate == run.counters.end())
      continue;
    figure& kept = figures_[name];
    if (run.aggregate_name == "median") {
      kept.rate = rate->second;
      kept.wall = run.counters.at(wall_counter);
    } else if (run.aggregate_name == "first_quartile") {
      kept.first_quartile = rate->second;
    } else if (run.aggregate_name == "third_quartile") {
      kept.third_quartile = rate->second;
    }
  }
}

const figures::figure* figures::fastest(const std::vector<std::string>& names) const {
  const figure* best = nullptr;
  for (const std::string& name : names) {
    const auto found = figures_.find(name);
    if (found != figures_.end() && (best == nullptr || found->second.rate > best->rate))
      best = &found->second;
  }
  return best;
}

void figures::print_heading() {
  std::printf("%-44s %8s %19s %9s %8s %9s   %s\n", "", "GB/s", "quartiles", "wait us", "cuRAND",
              "wait us", "share of the fill, and quotient over cuRAND");
}

void figures::print(const row& of) const {
  const figure* own = fastest({of.name});
  if (own == nullptr)
    return;
  const double scale = static_cast<double>(of.value_bytes) * 1e-9;
  std::printf("%-44s %8.1f %8.1f - %8.1f %9.1f", of.name.c_str(), own->rate * scale,
              own->first_quartile * scale, own->third_quartile * scale, own->wall * 1e6);
  const figure* peer = fastest(of.peers);
  if (peer != nullptr)
    std::printf(" %8.1f %9.1f ", peer->rate * scale, peer->wall * 1e6);
  else
    std::printf(" %8s %9s ", "", "");
  if (const figure* fill = fastest(of.fills))
    print_ratio(own->rate / fill->rate, of.asked_of_fill);
  if (peer != nullptr)
    print_ratio(own->rate / peer->rate, of.asked_over_peer);
  std::printf("\n");
}

}  // namespace gpu_bench
