# Draws the cost per subscriber over the number of subscribers. Needs `data`, a file with lines of series, subscribers, library
# and bare nanoseconds, and `picture`, the output file.
set terminal svg size 900,540 font "sans,14" background "white"
set output picture
set title "Cost per subscriber: processor time of program, bus and client service"
set xlabel "subscribers"
set ylabel "µs per subscriber"
set logscale x
set yrange [0:*]
set key bottom left
set grid
of(series, column) = stringcolumn(1) eq series ? column / 1000 : NaN
plot for [series in "notification push"] data using 2:(of(series, $3)) with linespoints linewidth 2 title series.", library", \
     for [series in "notification push"] data using 2:(of(series, $4)) with linespoints dashtype 2 title series.", bare"
