# SPDX-License-Identifier: Apache-2.0
# Draws what the benchmark's --chart wrote:
#     gnuplot -e "data = 'build/bench/chart.dat'; picture = 'chart.svg'" bench/chart.gp
load data

ours = '#0060c0'
peers = '#d06000'
grey = '#444444'

cases_height = cases > 0 ? 110 + 17 * cases : 0
growth_height = growth_layouts ne '' ? 400 : 0
height = cases_height + growth_height
set terminal svg size 1000, height background 'white' font 'sans-serif,11'
set output picture
set multiplot

if (cases > 0) {
    set origin 0, real(growth_height) / height
    set size 1, real(cases_height) / height
    set lmargin 46
    set title 'Time as a multiple of the limit (1: nothing but memory traffic)'
    set key below horizontal
    set logscale x
    set xrange [0.5:*]
    set yrange [cases - 0.5:-0.5]
    set ytics scale 0
    set grid x
    set arrow 1 from 1, cases - 0.5 to 1, -0.5 nohead lc rgb grey lw 2
    plot $cases using 2:0:($4 - $2):(0):ytic(1) with vectors nohead lc rgb '#cccccc' lw 3 notitle, \
         $cases using 2:0 with points pt 7 ps 0.7 lc rgb ours title 'ours, one thread', \
         $cases using 3:0 with points pt 6 ps 0.7 lc rgb ours title 'ours, wrapper', \
         $cases using 4:0 with points pt 13 ps 0.9 lc rgb peers title 'best peer, one thread'
    unset arrow 1
}

if (growth_layouts ne '') {
    set lmargin 9
    set key below horizontal
    set xrange [0.8:130]
    set yrange [0:*] noreverse
    set logscale x
    set xlabel 'source megapixels'
    set ylabel 'ns per source pixel'
    set ytics scale 1 autofreq
    set grid x y
    set size 0.5, real(growth_height) / height
    do for [i = 0:1] {
        set origin 0.5 * i, 0
        set title word(growth_layouts, i + 1) . ', to a quarter each way'
        plot $growth index i using 1:2 with linespoints pt 7 ps 0.6 lc rgb ours title 'ours', \
             $growth index i using 1:3 with linespoints pt 6 ps 0.6 lc rgb ours title 'wrapper', \
             $growth index i using 1:4 with lines lw 2 lc rgb grey title 'limit', \
             $growth index i using 1:5 with linespoints pt 13 ps 0.7 lc rgb peers title 'best peer'
    }
}
unset multiplot
