#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
# draw.sh GALLERY DOCS COLUMNS: draws all figures below DOCS with the program GALLERY (main.cpp). The
# folder COLUMNS is made anew, for the columns of the histograms.
set -eu
here=$(dirname "$0")
rm -rf "$3"
mkdir -p "$2/engines" "$2/distributions" "$3"
"$1" "$2" "$3"
gnuplot -c "$here/distributions.gnuplot" "$3" "$2/distributions"
