// SPDX-License-Identifier: Apache-2.0
// What a program of benchmarks compares: times of one machine mean little to another, quotients of
// one run do. A program announces its tables before it runs, as context of Google Benchmark's JSON;
// tools/bench_report makes them of the medians, for the console and for the manual.
//
// Names of benchmarks read row/column: a table of all figures has a row for each part before the
// last '/' and a column for each part behind it.
#pragma once

#include <string>
#include <vector>

// Takes the command line for the benchmarks, whose runs are interleaved: that spreads the noise of
// a shared machine over all of them alike. False if it does not understand an argument.
bool initialize(int argc, char** argv);

// The rate of one benchmark over that of the fastest of its peers.
struct quotient {
  std::string of;
  std::vector<std::string> peers;
  double goal = 0;           // the least that is asked; 0: nothing is
  std::string ceiling = {};  // reaching the rate of this benchmark will do as well
};
void announce_quotients(const std::string& table, const std::vector<quotient>& rows);

// The time of one benchmark, which should be below a limit.
struct time_limit {
  std::string of;
  double nanoseconds;
};
void announce_times(const std::string& table, const std::vector<time_limit>& rows);

// A rate that was measured by other means (values per second), to be a peer.
struct foreign_rate {
  std::string name;
  double rate;
};
void announce_rates(const std::vector<foreign_rate>& rates);
