// SPDX-License-Identifier: Apache-2.0
// Tables as context: the key says the kind and the name of a table, a line of the value is a row,
// whose fields are separated by '|' and the peers among them by ','.
#include "comparisons.hpp"

#include <sstream>

#include <benchmark/benchmark.h>

bool initialize(int argc, char** argv) {
  std::vector<char*> arguments(argv, argv + argc);
  char interleaved[] = "--benchmark_enable_random_interleaving=true";
  arguments.insert(arguments.begin() + 1, interleaved);
  int count = static_cast<int>(arguments.size());
  benchmark::Initialize(&count, arguments.data());
  return !benchmark::ReportUnrecognizedArguments(count, arguments.data());
}

void announce_quotients(const std::string& table, const std::vector<quotient>& rows) {
  std::ostringstream lines;
  for (const quotient& row : rows) {
    lines << row.of << '|';
    for (std::size_t i = 0; i < row.peers.size(); ++i)
      lines << (i == 0 ? "" : ",") << row.peers[i];
    lines << '|' << row.goal << '|' << row.ceiling << '\n';
  }
  benchmark::AddCustomContext("quotients: " + table, lines.str());
}

void announce_times(const std::string& table, const std::vector<time_limit>& rows) {
  std::ostringstream lines;
  for (const time_limit& row : rows)
    lines << row.of << '|' << row.nanoseconds << '\n';
  benchmark::AddCustomContext("times: " + table, lines.str());
}

void announce_rates(const std::vector<foreign_rate>& rates) {
  std::ostringstream lines;
  for (const foreign_rate& row : rates)
    lines << row.name << '|' << row.rate << '\n';
  benchmark::AddCustomContext("rates", lines.str());
}
