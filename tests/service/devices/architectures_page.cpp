// SPDX-License-Identifier: Apache-2.0
// The table of architectures in docs/device_services.md: prints what the library makes of every
// major number and release that a driver can name, for `./run tables`, and holds the page to it.
#include <cstdint>
#include <cstdio>
#include <fstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "architecture.hpp"

namespace {

using kestrel::tarn::forge::hw_of_ip_version;
using kestrel::tarn::gpu::architecture_of;

constexpr std::uint32_t last_major = 0x3FF, last_release = 0xFF;
const char* const names[] = {"", "Fir", "Elm", "Ash", "Oak", "Yew", "Pine", "Larch"};

// "<architecture> | <flags>", or empty where the number is not known.
std::string cells_of(std::uint32_t major, std::uint32_t release) {
  const auto found = architecture_of(hw_of_ip_version(major << 22 | release << 14));
  if (found.arch == TARN_GPU_ARCH_UNKNOWN)
    return "";
  return std::string(names[found.arch]) + " | " + std::to_string(found.flags);
}

// A line for each run of releases that are alike.
std::vector<std::string> expected_rows() {
  std::vector<std::string> rows;
  for (std::uint32_t major = 0; major <= last_major; ++major) {
    std::uint32_t first = 0;
    for (std::uint32_t release = 0; release <= last_release; ++release) {
      const std::string cells = cells_of(major, release);
      if (release < last_release && cells_of(major, release + 1) == cells)
        continue;
      if (!cells.empty()) {
        std::string releases = std::to_string(first);
        if (first == 0 && release == last_release)
          releases = "any";
        else if (first != release)
          releases += " to " + std::to_string(release);
        rows.push_back("| " + std::to_string(major) + " | " + releases + " | " + cells + " |");
      }
      first = release + 1;
    }
  }
  return rows;
}

TEST(architectures_page, are_those_of_the_library) {
  const std::vector<std::string> expected = expected_rows();
  for (const std::string& row : expected)
    std::puts(row.c_str());

  std::ifstream page(TARN_DOCS "/device_services.md");
  std::vector<std::string> kept;
  std::string line;
  while (std::getline(page, line) && line != "<!-- table: architectures -->") {
  }
  while (std::getline(page, line) && line != "<!-- end -->") {
    if (line.size() > 2 && line[2] >= '0' && line[2] <= '9')
      kept.push_back(line);
  }
  EXPECT_EQ(kept, expected) << "./run tables makes the table anew";
}

}  // namespace
