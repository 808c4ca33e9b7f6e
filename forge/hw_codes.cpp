// SPDX-License-Identifier: Apache-2.0
// Tables of device generations. Each row has a range of numbers, both ends included.
#include "hw_codes.hpp"

namespace kestrel::tarn::forge {
namespace {

struct core_family_row {
  std::uint32_t first;
  std::uint32_t last;
  hw_code hw;
};

constexpr core_family_row core_families[] = {
    {12, 12, hw_fir},     {13, 14, hw_unserved}, {15, 16, hw_elm},
    {17, 17, hw_oak},     {18, 18, hw_ash},      {3077, 3077, hw_oak},
    {3079, 3079, hw_yew}, {3080, 3080, hw_pine}, {3081, 3081, hw_larch},
};

struct product_row {
  std::uint32_t first;
  std::uint32_t last;
  family_code family;
};

constexpr product_row products[] = {
    {18, 25, 1},     {26, 27, 2},      {28, 32, 3},      {33, 1210, 4},
    {1250, 1250, 5}, {1270, 1270, 7},  {1271, 1271, 11}, {1272, 1272, 8},
    {1273, 1273, 9}, {1274, 1276, 14}, {1280, 1280, 13},
};

constexpr std::uint32_t last_release = 0xFF;

struct ip_version_row {
  std::uint32_t major;
  std::uint32_t first_release;
  std::uint32_t last_release;
  hw_code hw;
  family_code family;
};

constexpr ip_version_row ip_versions[] = {
    {9, 0, last_release, hw_fir, 1},
    {11, 0, last_release, hw_elm, 3},
    {12, 0, 10, hw_ash, 4},
    {12, 50, 50, hw_oak, 5},
    {12, 51, 59, hw_yew, 7},
    {12, 60, 60, hw_pine, 11},
    {12, 61, 61, hw_pine, 12},
    {12, 65, 65, hw_pine, 13},
    {12, 70, 71, hw_yew, 8},
    {12, 73, 74, hw_yew, 9},
    {20, 0, last_release, hw_larch, 14},
};

}  // namespace

family_code default_family(hw_code hw) noexcept {
  constexpr family_code families[] = {0, 1, 2, 3, 4, 5, 6, 10, 14};
  return hw >= hw_unknown && hw <= hw_larch ? families[hw] : 0;
}

hw_code hw_of_family(family_code family) noexcept {
  if (family >= default_family(hw_larch)) {
    return hw_larch;
  }
  if (family >= default_family(hw_pine)) {
    return hw_pine;
  }
  if (family >= default_family(hw_yew)) {
    return hw_yew;
  }
  return family >= 1 ? static_cast<hw_code>(family) : hw_unknown;
}

hw_code hw_of_core_family(std::uint32_t number) noexcept {
  for (const core_family_row& row : core_families) {
    if (number >= row.first && number <= row.last) {
      return row.hw;
    }
  }
  return hw_unknown;
}

std::uint32_t core_family_of_hw(hw_code hw) noexcept {
  switch (hw) {
    case hw_fir:
      return 12;
    case hw_elm:
      return 16;
    case hw_ash:
      return 18;
    case hw_yew:
      return 3079;
    case hw_pine:
      return 3080;
    case hw_larch:
      return 3081;
    default:
      return 0;
  }
}

family_code family_of_product(std::uint32_t number) noexcept {
  for (const product_row& row : products) {
    if (number >= row.first && number <= row.last) {
      return row.family;
    }
  }
  return 0;
}

detected_hw hw_of_ip_version(std::uint32_t ip_version) noexcept {
  const std::uint32_t major = ip_version >> 22;
  const std::uint32_t release = (ip_version >> 14) & 0xFF;
  for (const ip_version_row& row : ip_versions) {
    if (major == row.major && release >= row.first_release && release <= row.last_release) {
      return {row.hw, row.family, ip_version & 0x3F};
    }
  }
  return {};
}

detected_hw with_missing_code(detected_hw found) noexcept {
  if (found.family == 0) {
    found.family = default_family(found.hw);
  } else if (found.hw == hw_unknown) {
    found.hw = hw_of_family(found.family);
  }
  return found;
}

}  // namespace kestrel::tarn::forge
