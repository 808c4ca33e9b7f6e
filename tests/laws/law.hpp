// SPDX-License-Identifier: Apache-2.0
// A law that variates are held against, with the parameters already in it.
#pragma once

#include <functional>

namespace laws {

struct law {
  bool discrete;                        // on integers
  double lower, upper;                  // the ends of its support, which belong to it
  std::function<double(double)> cdf;    // P(X <= x)
  std::function<double(double)> below;  // the least x with P(X <= x) >= p
  std::function<double(double)> above;  // the least x with P(X > x) <= q
  std::function<double(double)> pmf;    // P(X = k); discrete laws only
};

}  // namespace laws
