# SPDX-License-Identifier: Apache-2.0
# Bars of what report.jq says: gnuplot -c bars.gnuplot COLUMNS FIGURE.svg. The first line of COLUMNS
# has the text of the axis and the names of the series, each further line a label and the numbers,
# separated by tabs. A series "goal" becomes marks.
columns = ARG1
set datafile separator "\t"
set datafile missing "nan"
stats columns skip 1 using 0 nooutput
rows = int(STATS_records)
heads = system(sprintf("head -n 1 '%s'", columns))
series = int(system(sprintf("head -n 1 '%s' | tr -cd '\t' | wc -c", columns)))
axis = system(sprintf("head -n 1 '%s' | cut -f 1", columns))
goals = system(sprintf("head -n 1 '%s' | cut -f %d", columns, series + 1)) eq "goal" ? 1 : 0
bars = series - goals
thick = 0.8 / bars

set terminal svg size 760,(90 + rows * (8 + 14 * bars)) font "sans-serif,12" background rgb "white" noenhanced
set output ARG2
set border 3
set tics nomirror out
set ytics scale 0
set grid xtics linecolor rgb "#dddddd"
set style fill solid noborder
set key outside top center horizontal
set xlabel axis
set xrange [0:*]
set yrange [rows - 0.5:-0.5]  # the first row is on top
array tint[7] = ["#9ecae1", "#08519c", "#fdae6b", "#e6550d", "#a1d99b", "#31a354", "#969696"]
colour(s) = tint[(s - 1) % 7 + 1]
place(s) = (s - (bars + 1) / 2.0) * thick

plot columns skip 1 using (0):0:ytic(1) with dots linecolor rgb "black" notitle, \
     for [s = 1:bars] columns skip 1 \
       using (column(s + 1) / 2):($0 + place(s)):(column(s + 1) / 2):(thick * 0.45) \
       with boxxyerror linecolor rgb colour(s) \
       title system(sprintf("head -n 1 '%s' | cut -f %d", columns, s + 1)), \
     for [s = bars + 1:series] columns skip 1 using (column(s + 1)):0 \
       with points pointtype 7 pointsize 0.6 linecolor rgb "black" title "goal"
