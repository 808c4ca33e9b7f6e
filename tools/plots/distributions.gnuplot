# SPDX-License-Identifier: Apache-2.0
# Draws the columns that distribution_histograms wrote: gnuplot -c distributions.gnuplot FROM TO
# makes TO/<name>.svg of every FROM/<name>.density and FROM/<name>.probabilities.
from = ARG1
to = ARG2

set terminal svg size 560,300 font "sans-serif,12" background rgb "white" noenhanced
set border 3
set tics nomirror out
set style fill solid noborder
set boxwidth 0.85 relative
set key tmargin center vertical
set autoscale xfix
set yrange [0:*]

do for [file in system(sprintf("ls '%s'", from))] {
  dot = strstrt(file, ".")
  kind = file[dot + 1:*]
  columns = from . "/" . file
  set output to . "/" . file[1:dot - 1] . ".svg"
  if (kind eq "density") {
    plot columns using 1:2 with boxes linecolor rgb "#9ecae1" title columnheader(2), \
         columns using 1:3 with lines linewidth 1.5 linecolor rgb "#08519c" title kind
  } else {
    plot columns using 1:2 with boxes linecolor rgb "#9ecae1" title columnheader(2), \
         columns using 1:3 with points pointtype 7 pointsize 0.4 linecolor rgb "#08519c" title kind
  }
}
