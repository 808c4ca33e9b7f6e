// SPDX-License-Identifier: Apache-2.0
// Tests a table that exists.
#pragma once

#include <cstdint>
#include <string>

namespace tarn::mt2203 {

// Whether the file has all rows and those of the ids first..last keep what is required of them.
// Faults go to stderr, figures to stdout. With `second_method` the periods are proved both ways.
bool verify_table(const std::string& path, std::uint32_t first, std::uint32_t last,
                  bool second_method);

}  // namespace tarn::mt2203
