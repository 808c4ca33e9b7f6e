// SPDX-License-Identifier: Apache-2.0
// tarn_gallery DOCS COLUMNS: the figures of the manual below DOCS. Writes the page DOCS/gallery.md
// and the pictures DOCS/engines/*.svg, and the columns of the histograms into the folder COLUMNS,
// from which distributions.gnuplot draws DOCS/distributions/*.svg.
#include <cstdio>
#include <exception>

#include "histograms.hpp"
#include "page.hpp"

int main(int argc, char** argv) {
  if (argc != 3) {
    std::fprintf(stderr, "usage: tarn_gallery DOCS COLUMNS\n");
    return 2;
  }
  try {
    const std::string docs = argv[1];
    const std::vector<plot> plots = every_plot();
    const std::vector<scatter> scatters = every_scatter();
    for (const plot& of : plots)
      write_columns(of, argv[2]);
    for (const scatter& of : scatters)
      write_scatter(of, docs + "/engines");
    write_page(plots, scatters, docs + "/gallery.md");
  } catch (const std::exception& failure) {
    std::fprintf(stderr, "tarn_gallery: %s\n", failure.what());
    return 1;
  }
  return 0;
}
