# Throughput against package size, ours and peers, one panel a workload and operation; below,
# ours over the fastest peer and over the floor, with the targets as dashed lines.
# gnuplot -e "data='throughput.dat'; ratios='ratios.dat'; output='bench.svg'" \
#   -e "load 'chart-title.gp'" bench/chart.gp
set terminal svg size 1400,1100 dynamic font "sans,11" background rgb "white"
set output output
set datafile missing "NaN"
set logscale xy
set xrange [0.003:80]
set yrange [*:*]
set format y "%g"
sizes = 'set xtics ("4K" 0.004, "64K" 0.064, "1M" 1, "8M" 8, "50M" 50)'
eval sizes
set grid ytics xtics lc rgb "#dddddd"
unset key
set xlabel "package MB" offset 0,0.5
set ylabel "MB/s" offset 1.5,0
set multiplot layout 3,4 title "DataDirectory package: throughput against size\n".machine font ",12"
do for [block in "game-state@write nested@write text-heavy@write adversarial@write game-state@read nested@read text-heavy@read adversarial@read"] {
  name = block[1:strstrt(block, "@") - 1]
  op = block[strstrt(block, "@") + 1:]
  set title name." ".op
  if (name eq "adversarial" && op eq "write") {
    # The one empty panel carries the legend.
    set key center center font ",12" samplen 3 spacing 1.5
    set label 1 "hostile texts are read only" at graph 0.5, 0.1 center
    unset border
    unset tics
    unset grid
    unset xlabel
    unset ylabel
    plot [1:2] [1:2] NaN with linespoints lw 2.5 pt 7 lc rgb "#d62728" title "ours", \
         NaN with linespoints lw 1.5 pt 5 lc rgb "#1f77b4" title "pugixml", \
         NaN with linespoints lw 1.5 pt 9 lc rgb "#2ca02c" title "tinyxml2", \
         NaN with linespoints lw 1.5 dt 2 pt 1 lc rgb "#7f7f7f" title "floor (conversions + one pass)"
    unset label 1
    unset key
    set border
    set tics
    eval sizes
    set grid ytics xtics lc rgb "#dddddd"
    set xlabel "package MB" offset 0,0.5
    set ylabel "MB/s" offset 1.5,0
  } else {
    plot data index name." ".op using 1:2 with linespoints lw 2.5 pt 7 lc rgb "#d62728" title "ours", \
         "" index name." ".op using 1:3 with linespoints lw 1.5 pt 5 lc rgb "#1f77b4" title "pugixml", \
         "" index name." ".op using 1:4 with linespoints lw 1.5 pt 9 lc rgb "#2ca02c" title "tinyxml2", \
         "" index name." ".op using 1:5 with linespoints lw 1.5 dt 2 pt 1 lc rgb "#7f7f7f" title "floor"
  }
}
# Targets: over the fastest peer 3 writing and reading below 1 MB, 2 reading from 1 MB on; over
# the floor two thirds writing, one half reading.
set ylabel "ours over" offset 1.5,0
set yrange [0.1:50]
set key top left font ",9" samplen 2 spacing 1 maxrows 4
readTarget(x) = x < 0.99 ? 3 : 2
do for [name in "game-state nested text-heavy adversarial"] {
  set title name.": ratios, targets dashed"
  plot ratios index name." ratios" using 1:2 with linespoints lw 2 pt 7 lc rgb "#9467bd" title "write/peer", \
       "" index name." ratios" using 1:4 with linespoints lw 2 pt 5 lc rgb "#d62728" title "read/peer", \
       "" index name." ratios" using 1:3 with linespoints lw 1.5 pt 9 lc rgb "#8c564b" title "write/floor", \
       "" index name." ratios" using 1:5 with linespoints lw 1.5 pt 1 lc rgb "#e377c2" title "read/floor", \
       3 with lines dt 2 lc rgb "#9467bd" notitle, \
       readTarget(x) with lines dt 2 lc rgb "#d62728" notitle, \
       2.0 / 3 with lines dt 3 lc rgb "#8c564b" notitle, \
       0.5 with lines dt 3 lc rgb "#e377c2" notitle
  unset key
}
unset multiplot
