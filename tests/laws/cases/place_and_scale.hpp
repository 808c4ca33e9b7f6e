// SPDX-License-Identifier: Apache-2.0
// Families with a place and a scale: the same parameters for all, small and large against each
// other and by themselves.
#pragma once

#include <initializer_list>
#include <vector>

#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

template <class Real, class Draw>
void add_places_and_scales(std::vector<specimen>& all, const char* name, Draw draw,
                           law expected(double, double),
                           std::initializer_list<std::int64_t> methods) {
  const double sets[][2] = {{0, 1},   {1, 1},    {-2, 0.5},  {10, 30},  {0, 1e-20}, {0, 1e20},
                            {-1, 10}, {2, 0.25}, {1e6, 1e5}, {-0.1, 3}, {7, 1},     {-1e-9, 1e-9}};
  for (const auto& set : sets) {
    const auto a = static_cast<Real>(set[0]), b = static_cast<Real>(set[1]);
    for (const std::int64_t method : methods) {
      const bool accurate = (method & RVX_RNG_METHOD_ACCURACY_FLAG) != 0;
      all.push_back(routine(form_name<Real>(name), draw, method, expected(a, b),
                            resolution_of<Real>(a, accurate), a, b));
    }
  }
}

// Both forms of a routine.
template <class Single, class Double>
std::vector<specimen> places_and_scales(const char* name, Single single, Double twofold,
                                        law expected(double, double),
                                        std::initializer_list<std::int64_t> methods = {0}) {
  std::vector<specimen> all;
  add_places_and_scales<float>(all, name, single, expected, methods);
  add_places_and_scales<double>(all, name, twofold, expected, methods);
  return all;
}

}  // namespace laws
