// SPDX-License-Identifier: Apache-2.0
// Keeps the medians and quartiles of a run and prints them as a table of rows, each beside its
// peers and the ceiling of the same run, with what is asked for.
#pragma once

#include <cstddef>
#include <map>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

namespace gpu_bench {

/// The counter that holds the seconds from a call to the end of the wait for it.
constexpr char wall_counter[] = "wall";

/// Has the quartiles computed beside the median, and nothing but the files show single runs.
void take_quartiles(benchmark::internal::Benchmark* of);

struct row {
  std::string name;
  std::size_t value_bytes;
  std::vector<std::string> fills;  // ways to reach the ceiling; the fastest counts
  std::vector<std::string> peers;  // likewise
  double asked_of_fill;            // least share of the ceiling; 0: nothing is asked
  double asked_over_peer;          // least quotient over the peer; 0: nothing is asked
};

class figures : public benchmark::BenchmarkReporter {
 public:
  bool ReportContext(const Context& context) override;
  void ReportRuns(const std::vector<Run>& runs) override;

  /// One line: rates on the device, times of a call with its wait, quotients and verdicts. Nothing
  /// if the row did not run.
  void print(const row& of) const;
  static void print_heading();

 private:
  struct figure {
    double rate;  // median, values per second
    double first_quartile;
    double third_quartile;
    double wall;  // median, seconds
  };
  // What ran of these and was fastest, or null.
  const figure* fastest(const std::vector<std::string>& names) const;

  std::map<std::string, figure> figures_;
};

}  // namespace gpu_bench
