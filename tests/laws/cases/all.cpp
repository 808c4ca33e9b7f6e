// SPDX-License-Identifier: Apache-2.0
#include <set>
#include <utility>

#include "../specimen.hpp"

namespace laws {

std::vector<specimen> every_case() {
  std::vector<specimen> all;
  const auto add = [&](std::vector<specimen>&& family) {
    for (specimen& s : family)
      all.push_back(std::move(s));
  };
#define TARN_FAMILY(name) add(name##_cases());
#include "../families.def"
  return all;
}

std::vector<specimen> every_method() {
  std::vector<specimen> chosen;
  std::set<std::pair<std::string, std::int64_t>> seen;
  for (specimen& s : every_case()) {
    if (seen.emplace(s.routine, s.method).second)
      chosen.push_back(std::move(s));
  }
  return chosen;
}

}  // namespace laws
