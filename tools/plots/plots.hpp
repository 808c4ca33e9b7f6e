// SPDX-License-Identifier: Apache-2.0
// What the figures of the manual show: for each distribution, how values are drawn, and the law
// that its page states.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <tarn_rvx.h>
#include <vector>

struct plot {
  std::string name;        // of the family
  std::string parameters;  // as the key of the figure gives them
  bool integers;  // one bar for each integer of [low, high]; else equal parts of [low, high)
  double low, high;
  std::function<std::vector<double>(rvx_stream, std::size_t n)> draw;
  std::function<double(double)> law;  // density or probability
};

std::vector<plot> every_plot();
