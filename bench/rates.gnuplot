# The picture of docs/performance.md, from what `bench_rates --curve rates.txt` writes:
#     gnuplot -e "curves='rates.txt'; picture='rates.svg'" bench/rates.gnuplot
set terminal svg size 900,620 font "sans,13" background "white"
set output picture
set datafile missing "nan"
set multiplot layout 2,1
set grid lc rgb "#dddddd"
set key top left
set lmargin 11
set xrange [18:24]
set format x "%g"
set arrow 1 from first 22.05, graph 0 to first 22.05, graph 1 nohead dt 2 lc rgb "#888888"

set title "48 to 44.1 kHz: gain of the pass band" offset 0,-0.5
set ylabel "dB"
set yrange [-0.2:0.05]
set ytics 0.05
set key bottom left
plot curves using ($1/1000):2 with lines lw 2 lc rgb "#1f5fbf" title "wavkit best", \
     curves using ($1/1000):6 with lines lw 2 lc rgb "#d9534f" title "soxr VHQ"

set title "what else comes out: beside a tone below 22.05 kHz, of one above it" offset 0,-0.5
set ylabel "dB below the tone"
set xlabel "frequency of the tone, kHz"
set yrange [-250:0]
set ytics 50
set key top left
plot curves using ($1/1000):3 with lines lw 2 lc rgb "#1f5fbf" title "wavkit best", \
     curves using ($1/1000):7 with lines lw 2 lc rgb "#d9534f" title "soxr VHQ", \
     curves using ($1/1000):9 with lines lw 1.5 lc rgb "#e8a838" title "soxr HQ"
unset multiplot
