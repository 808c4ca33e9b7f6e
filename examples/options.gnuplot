# SPDX-License-Identifier: Apache-2.0
# The convergence of options.cpp as SVG: gnuplot -c options.gnuplot TABLE FIGURE
set terminal svg size 720,420 font "sans-serif,12" background rgb "white" dynamic
set output ARG2
set logscale x 2
set logscale y 10
set format x "2^{%L}"
set format y "10^{%L}"
set xlabel "paths"
set ylabel "root mean square error of the price"
set yrange [1e-4:10]
set key bottom left Left reverse
set grid linecolor rgb "#cccccc"
set style data linespoints
plot ARG1 using 1:3 title "European, philox4x32x10" linecolor rgb "#d95f02" pointtype 6, \
     ARG1 using 1:5 title "Asian, philox4x32x10" linecolor rgb "#d95f02" pointtype 7, \
     ARG1 using 1:2 title "European, sobol" linecolor rgb "#1b6ca8" pointtype 6, \
     ARG1 using 1:4 title "Asian, sobol" linecolor rgb "#1b6ca8" pointtype 7, \
     18 / sqrt(x) title "slope -1/2" with lines linecolor rgb "#888888" dashtype 2, \
     20 / x title "slope -1" with lines linecolor rgb "#888888" dashtype 3
