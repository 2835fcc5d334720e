#!/usr/bin/env bash
# The desktop program's list against the command-line tool on a generated
# database of 65504 records, each a whole process as a user would run it:
#   - start, open and paint the first rows (bench_gui --first-paint) against
#     `cardovex-cli resave` (open and save) of the same file, and the same
#     start with a 10-record file (what the toolkit's start costs alone);
#   - the same plus a sort on the Name heading (bench_gui --header-sort)
#     against `cardovex-cli sort FILE Name` (open, sort, recalculate, save),
#     and the heading sort alone as the difference of the two GUI figures.
# Jumping to the last row is measured in process by bench_gui itself.
#   bench/gui_vs_cli.sh [BUILD_DIR] [RUNS]
set -euo pipefail
build="${1:-build}"
runs="${2:-11}"
cli="$build/cli/cardovex-cli"
gui="$build/bench/bench_gui"
gen="$build/bench/cardovex-generate"
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT
export QT_QPA_PLATFORM=offscreen HOME=$work XDG_CONFIG_HOME=$work/config XDG_RUNTIME_DIR=$work/runtime

"$gen" "$work/big.PDB" 65504 1 >/dev/null
"$gen" "$work/small.PDB" 10 1 >/dev/null
cp "$work/big.PDB" "$work/sorted.PDB"
"$cli" resave "$work/big.PDB"  # warm the page cache

median() { sort -n | awk '{a[NR]=$1} END {print (NR%2) ? a[(NR+1)/2] : (a[NR/2]+a[NR/2+1])/2}'; }
now() { date +%s.%N; }
timed() { local t0 t1; t0=$(now); "$@" >/dev/null 2>&1; t1=$(now); echo "$t1 - $t0" | bc -l; }

paint=() resave=() gsort=() csort=() small=()
for ((i = 0; i < runs; i++)); do
  small+=("$(timed "$gui" --first-paint "$work/small.PDB")")
  paint+=("$(timed "$gui" --first-paint "$work/big.PDB")")
  resave+=("$(timed "$cli" resave "$work/big.PDB")")
  gsort+=("$(timed "$gui" --header-sort "$work/big.PDB")")
  # Each CLI sort starts from the same unsorted file.
  cp "$work/big.PDB" "$work/sorted.PDB"
  csort+=("$(timed "$cli" sort "$work/sorted.PDB" Name)")
done
p=$(printf '%s\n' "${paint[@]}" | median)
r=$(printf '%s\n' "${resave[@]}" | median)
g=$(printf '%s\n' "${gsort[@]}" | median)
c=$(printf '%s\n' "${csort[@]}" | median)
s=$(printf '%s\n' "${small[@]}" | median)
ms() { echo "$1 * 1000" | bc -l; }
printf 'medians of %d runs, 65504 records\n' "$runs"
printf 'start, open, first paint (GUI):   %6.1f ms\n' "$(ms "$p")"
printf '  the same with 10 records:        %6.1f ms (the toolkit starting)\n' "$(ms "$s")"
printf 'cardovex-cli resave:              %6.1f ms\n' "$(ms "$r")"
printf 'ratio first paint / resave:       %6.2f\n' "$(echo "$p / $r" | bc -l)"
printf 'GUI with a heading sort:          %6.1f ms (the sort and its paint: %.1f ms)\n' \
  "$(ms "$g")" "$(ms "$(echo "$g - $p" | bc -l)")"
printf 'cardovex-cli sort FILE Name:      %6.1f ms\n' "$(ms "$c")"
printf 'ratio heading sort / cli sort:    %6.2f\n' "$(echo "($g - $p) / $c" | bc -l)"
