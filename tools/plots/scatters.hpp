// SPDX-License-Identifier: Apache-2.0
// Pictures of engines: points in the unit square whose coordinates are successive values.
#pragma once

#include <string>
#include <utility>
#include <vector>

struct scatter {
  std::string name;     // of the engine, or <engine>_<what>
  std::string caption;  // under the square
  bool quasi_random;
  bool repeatable;  // the same points in every run
  std::vector<std::pair<double, double>> points;
};

// One of each row of engines.def, and further ones that show what a page warns of.
std::vector<scatter> every_scatter();

// Writes FOLDER/<name>.svg; a picture that no run repeats stays if it is there. Plain text of some
// ten bytes a point: what general programs write is ten times that.
void write_scatter(const scatter& of, const std::string& folder);
