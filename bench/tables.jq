# Tables of the results, a family each: the best peer's time over ours, least times of one run. The
# columns are those of the best set; of the others there are the geometric means of a line.

def fixed: (. * 100 | round | tostring) as $n | ("00"[:([3 - ($n | length), 0] | max)] + $n)
    | .[:-2] + "." + .[-2:];
def mean: map(log) | add / length | exp;
def distinct: reduce .[] as $x ([]; if any(.[]; . == $x) then . else . + [$x] end);
def peer: .peers | to_entries | min_by(.value);
def ratio($set): peer.value / .sets[$set];
def title: "\(.line), \(.column)";
def worst($set): min_by(ratio($set));
def geometric($set): map(ratio($set)) | mean | fixed;

def padded($width): . + ([range($width - length)] | map(" ") | add);
def table:
    ([transpose[] | map(length) | max]) as $widths
    | map([., $widths] | transpose
        | map(. as [$text, $width] | " " + ($text | padded($width)) + " |") | "|" + add)
    | .[0], ($widths | map("-" * (. + 2) + "|") | "|" + add), .[1:][];

(.cells[0].sets | keys_unsorted | reverse) as $sets
| $sets[0] as $best
| (.cells | map(.family) | distinct) as $families
| (.cells | group_by(.family) | map({(.[0].family): .}) | add) as $by_family
| ($families[] | . as $family | $by_family[$family]
    | (map(.column) | distinct) as $columns
    | . as $cells
    | "### \($family)\n",
      ([["", $columns[], $sets[1:][], "peer"]]
        + [map(.line) | distinct | .[] as $line
            | ($cells | map(select(.line == $line))) as $row
            | [$line,
               ($columns[] as $c | $row | map(select(.column == $c))
                   | if length > 0 then .[0] | ratio($best) | fixed else "" end),
               ($sets[1:][] as $set | $row | geometric($set)),
               ($row | map(peer.key) | distinct | join(", "))]]
        | table),
      "\n\($family): geometric mean \(geometric($best)), worst row \(worst($best)
        | "\(ratio($best) | fixed) (\(title))")\n"),
  "### All families\n",
  ([["", "cells", "behind", $best, "worst", $sets[1:][]]]
    + [$families[] as $f | $by_family[$f]
        | [$f, (length | tostring), (map(select(ratio($best) < 1)) | length | tostring),
           geometric($best), (worst($best) | ratio($best) | fixed),
           ($sets[1:][] as $set | geometric($set))]]
    | table),
  (.cells | "\nAll \(length): geometric mean \(geometric($best)), worst row \(worst($best)
    | "\(ratio($best) | fixed) (\(.family): \(title))")")
