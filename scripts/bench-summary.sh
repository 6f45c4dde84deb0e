#!/usr/bin/env bash
# Prints the goal rows the benchmark programs appended to one file (tab
# separated: goal, figure, baseline, ratio, limit, result) as one table.
# Usage: scripts/bench-summary.sh GOALS_FILE
set -euo pipefail
file=${1:?usage: bench-summary.sh GOALS_FILE}
if [[ ! -s $file ]]; then
  echo "No goal rows in $file: did the benchmarks run?" >&2
  exit 1
fi
{
  printf 'Goal\tFigure\tBaseline (same run)\tRatio\tLimit\tResult\n'
  cat "$file"
} | awk -F'\t' '
  { for (i = 1; i <= NF; ++i) { cell[NR, i] = $i; if (length($i) > w[i]) w[i] = length($i) }
    if (NF > cols) cols = NF }
  END {
    line = ""
    for (i = 1; i <= cols; ++i) { s = ""; for (k = 0; k < w[i]; ++k) s = s "-"; line = line (i > 1 ? "-+-" : "") s }
    for (r = 1; r <= NR; ++r) {
      out = ""
      for (i = 1; i <= cols; ++i) out = out (i > 1 ? " | " : "") sprintf("%-" w[i] "s", cell[r, i])
      print out
      if (r == 1) print line
    }
  }'
held=$(awk -F'\t' '$6 == "holds"' "$file" | wc -l)
total=$(wc -l < "$file")
echo
echo "$held of $total goals hold."
