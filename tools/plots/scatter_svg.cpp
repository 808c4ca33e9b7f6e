// SPDX-License-Identifier: Apache-2.0
// A scatter as SVG: a square of 1000 units a side, in which each point is a line of no length with
// round ends.
#include <cmath>
#include <filesystem>
#include <fstream>
#include <stdexcept>

#include "scatters.hpp"

void write_scatter(const scatter& of, const std::string& folder) {
  const std::string path = folder + '/' + of.name + ".svg";
  if (!of.repeatable && std::filesystem::exists(path))
    return;
  std::ofstream file(path);
  file
      << "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"320\" height=\"340\" "
         "viewBox=\"-40 -40 1080 1147\">\n"
         "<rect x=\"-40\" y=\"-40\" width=\"1080\" height=\"1147\" fill=\"white\"/>\n"
         "<path d=\"M0 0h1000v1000h-1000z\" fill=\"none\" stroke=\"#969696\" stroke-width=\"3\"/>\n"
         "<text x=\"500\" y=\"1062\" font-family=\"sans-serif\" font-size=\"42\" "
         "text-anchor=\"middle\">"
      << of.caption
      << "</text>\n<path stroke=\"#08519c\" stroke-width=\"9\" stroke-linecap=\"round\" d=\"";
  int in_line = 0;
  for (const auto& [x, y] : of.points) {
    file << (in_line == 0 ? "\n" : " ") << 'M' << std::lround(1000 * x) << ' '
         << std::lround(1000 * (1 - y)) << "h0";
    in_line = (in_line + 1) % 8;
  }
  file << "\"/>\n</svg>\n";
  if (!file.flush())
    throw std::runtime_error("cannot write " + path);
}
