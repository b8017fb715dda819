# Draws what the driver was told over time. The client sets these before:
#   terminal               "svg" or "pngcairo"
#   title, note            texts above the plot; the note may be empty
#   start, length          the time that is shown, in s
#   columns                its width in pixels
#   going_on               strength in % of a run that goes on at the end, -1 if none does
#   $calls                 times of the calls in s
#   $labels                times in s, and the labels of the calls there
#   $run, $packet, $pattern, $beyond
#                          bars: start and end in s, and strength in %; empty where there are none

left = 84
right = 120
strip = 220
bottom = 106
width = left + columns + right
font_size = 14

# The space above the strip holds the texts and the longest label, which rises at 45 degrees.
called(label) = label[strstrt(label, ' ') + 1:*]
longest = 0
do for [i = 1:|$labels|] {
    longest = strlen(called($labels[i])) > longest ? strlen(called($labels[i])) : longest
}
top = 62 + (strlen(note) > 0 ? 22 : 0) + longest * 0.6 * font_size * 0.71
height = top + strip + bottom

set terminal @terminal size width, height font 'sans-serif,'.font_size background '#ffffff'
set termoption noenhanced
set border 3 lc rgb '#444444'
set tics nomirror out
set format '%g'
set lmargin at screen real(left) / width
set rmargin at screen 1 - real(right) / width
set bmargin at screen bottom / height
set tmargin at screen 1 - top / height

set label title at screen 16.0 / width, screen 1 - 22 / height font ',16'
if (strlen(note) > 0) {
    set label note at screen 16.0 / width, screen 1 - 44 / height font ',12'
}
set key at screen 1 - real(right) / width, screen 24 / height right center horizontal Left reverse \
    samplen 1.5

unit = length < 2 ? 1000 : 1
set xrange [start * unit:(start + length) * unit]
if (length < 120) {
    set xlabel (length < 2 ? 'time in ms' : 'time in s') offset 0, 0.4
} else {
    set xtics time format (length < 7200 ? '%tM:%tS' : '%tH:%tM')
    set xlabel (length < 7200 ? 'time in min:s' : 'time in h:min') offset 0, 0.4
}
set yrange [0:100]
set ytics 25
set grid ytics lc rgb '#dddddd' lt 1
set ylabel 'strength in %' offset 1, 0

do for [i = 1:|$labels|] {
    set label called($labels[i]) at real($labels[i]) * unit, graph 1.02 rotate by 45 tc rgb '#222222'
}
if (going_on >= 0) {
    end = start + length / 1.01
    set arrow from end * unit, going_on / 2 rto graph 24.0 / columns, 0 filled lw 2 lc rgb '#444444'
    set label 'goes on' at end * unit, going_on / 2 offset graph 30.0 / columns, 0
}

# A layer of bars; an empty one is not in the legend.
layer(block, size, bottom, colour, name) = size == 0 ? '' : \
    ', '.block.' using ($1 * unit):3:($1 * unit):($2 * unit):('.bottom.'):3 '. \
    'with boxxyerror fs solid noborder'. \
    " lc rgb '".colour."' title '".name."'"
calls = "$calls using ($1 * unit):(100) with impulses lc rgb '#999999' dt 3 notitle"
eval 'plot '.calls. \
    layer('$run', |$run|, 0, '#0072b2', 'motor on'). \
    layer('$packet', |$packet|, 0, '#e69f00', 'haptic engine packets'). \
    layer('$pattern', |$pattern|, 0, '#009e73', 'stored pattern'). \
    layer('$beyond', |$beyond|, 96, '#d55e00', 'beyond full strength')
