// SPDX-License-Identifier: Apache-2.0
// See verify.hpp.
#include "verify.hpp"

#include <algorithm>
#include <cstdio>
#include <vector>

#include "decimation.hpp"
#include "irreducible.hpp"
#include "member.hpp"
#include "table_file.hpp"

namespace tarn::mt2203 {

namespace {

// Mask bits that no output can feel: what is shifted in from below is 0.
constexpr std::uint32_t dead_b = (std::uint32_t{1} << mt2203_shape.shift_s) - 1;
constexpr std::uint32_t dead_c = (std::uint32_t{1} << mt2203_shape.shift_t) - 1;

// Counts faults and tells each.
class fault_list {
 public:
  void require(bool holds, std::uint32_t id, const char* what) {
    if (holds)
      return;
    std::fprintf(stderr, "row %u: %s\n", id, what);
    ++count_;
  }
  bool empty() const { return count_ == 0; }

 private:
  int count_ = 0;
};

// How many candidates were tried before and with this one.
std::uint32_t tries(std::uint32_t id, std::uint32_t a) {
  std::uint32_t number = 0;
  while (number + 1 < candidates && candidate(id, number) != a)
    ++number;
  return number + 1;
}

void prove_by_decimation(const std::vector<parameters>& rows, std::uint32_t first,
                         std::uint32_t last, fault_list& faults) {
  for (std::uint32_t begin = first; begin <= last; begin += decimation_lanes) {
    std::array<std::uint32_t, decimation_lanes> a{};
    const std::uint32_t count =
        std::min(last - begin + 1, static_cast<std::uint32_t>(decimation_lanes));
    for (std::uint32_t i = 0; i < count; ++i)
      a[i] = rows[begin + i].a;
    const auto proved = irreducible_by_decimation(a);
    for (std::uint32_t i = 0; i < count; ++i)
      faults.require(proved[i], begin + i, "inversive decimation does not come back");
  }
}

}  // namespace

bool verify_table(const std::string& path, std::uint32_t first, std::uint32_t last,
                  bool second_method) {
  const std::vector<parameters> rows = read_table(path);
  if (rows.size() != members) {
    std::fprintf(stderr, "%s has %zu rows, not %u\n", path.c_str(), rows.size(), members);
    return false;
  }
  fault_list faults;
  int lowest = highest_defect, highest = 0;
  double defects = 0, tried = 0;
  for (std::uint32_t id = first; id <= last; ++id) {
    const parameters& row = rows[id];
    faults.require((row.a & 0xFFFF) == id, id, "the low 16 bits are not the id");
    faults.require((row.b & dead_b) == 0 && (row.c & dead_c) == 0, id, "a mask bit without effect");
    const bool full_period = irreducible(row.a);
    faults.require(full_period, id, "the characteristic polynomial is reducible");
    if (!full_period)
      continue;
    const equidistribution quality = measure_equidistribution(mt2203_shape, row);
    faults.require(acceptable(quality), id, "the equidistribution misses a bound");
    lowest = std::min(lowest, quality.defect);
    highest = std::max(highest, quality.defect);
    defects += quality.defect;
    tried += tries(id, row.a);
  }
  if (second_method)
    prove_by_decimation(rows, first, last, faults);
  if (!faults.empty())
    return false;
  const double count = last - first + 1;
  std::printf("%.0f rows hold; defects %d to %d, mean %.1f; candidates per row, mean %.1f\n", count,
              lowest, highest, defects / count, tried / count);
  return true;
}

}  // namespace tarn::mt2203
