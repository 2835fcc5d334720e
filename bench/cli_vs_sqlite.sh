#!/usr/bin/env bash
# The command-line tool's three whole-process figures against sqlite3 on the
# same data in the same run, on a generated database of 65504 records:
#
#   export  `cardovex-cli export-csv FILE OUT` (every record)
#           against `sqlite3 -csv DB "select * from items"` into a file
#   sort    `cardovex-cli sort FILE City Quantity:reverse Name` (sort,
#           recalculate, save) against sqlite3 writing the table again in
#           ORDER BY city, quantity desc, name
#   resave  `cardovex-cli resave FILE` against `cp FILE COPY && sync COPY`
#   add     `cardovex-cli add FILE Name=... Quantity=...` (one record placed,
#           recalculated, saved) against `cardovex-cli resave` of the same
#           file; a file of 65503 records, since a full one takes no more,
#           copied afresh before every run of either side
#
# The two sides of a step run alternately, RUNS times each (after one
# untimed warm-up), so that a burst of load on a shared machine hits both.
# Prints the median wall time of each side, the ratio of the medians and
# the range of the per-round ratios, plus the median CPU time (user +
# system) of each side, which load disturbs less than wall time.
#
#   bench/cli_vs_sqlite.sh [BUILD_DIR] [RUNS]      (default: build 9)
set -euo pipefail
build="${1:-build}"
runs="${2:-9}"
cli="$build/cli/cardovex-cli"
gen="$build/bench/cardovex-generate"
for tool in "$cli" "$gen"; do
  [ -x "$tool" ] || { echo "build the targets cardovex-cli and cardovex-generate in $build first" >&2; exit 2; }
done
command -v sqlite3 >/dev/null || { echo "sqlite3 is not installed" >&2; exit 2; }
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT INT TERM

cx() { LC_ALL=C "$cli" --date-format M/d/yyyy --time-format "h:mm:ss tt" --decimal . "$@"; }

"$gen" "$work/data.PDB" 65504 7 >/dev/null
"$gen" "$work/room.PDB" 65503 7 >/dev/null
cx export-csv "$work/data.PDB" "$work/data.csv" >/dev/null
sqlite3 "$work/data.db" "create table items(name, quantity integer, price, color, paid, id, photo,
  born, at, customer, orderno, notes, details, supplier, total, running, city, rating);" \
  ".mode csv" ".import $work/data.csv items"

# timed OUTVAR COMMAND...: wall microseconds of the command in OUTVAR and
# its CPU milliseconds (user + system, children included) in CPU_MS.
timed() {
  local -n into=$1; shift
  local TIMEFORMAT='%3R %3U %3S'
  { time "$@" >/dev/null 2>&1; } 2>"$work/times"
  into=$(awk '{ printf "%d", $1 * 1000000 }' "$work/times")
  CPU_MS=$(awk '{ printf "%d", ($2 + $3) * 1000 }' "$work/times")
}

median() { sort -n | awk '{a[NR]=$1} END {print (NR%2) ? a[(NR+1)/2] : (a[NR/2]+a[NR/2+1])/2}'; }

cx_export() { cx export-csv "$work/data.PDB" "$work/out.csv"; }
sq_export() { sqlite3 -csv "$work/data.db" "select * from items;" >"$work/sq.csv"; }
cx_sort_prep() { cp "$work/data.PDB" "$work/sort.PDB"; }
cx_sort() { cx sort "$work/sort.PDB" City Quantity:reverse Name; }
sq_sort_prep() { cp "$work/data.db" "$work/sort.db"; }
sq_sort() {
  sqlite3 "$work/sort.db" "begin; create table sorted as select * from items
    order by city collate nocase, quantity desc, name collate nocase;
    drop table items; alter table sorted rename to items; commit;"
}
cx_resave() { cx resave "$work/data.PDB"; }
cp_prep() { rm -f "$work/copy.PDB"; }
cp_sync() { sh -c 'cp "$1" "$2" && sync "$2"' sh "$work/data.PDB" "$work/copy.PDB"; }
add_prep() { cp "$work/room.PDB" "$work/add.PDB"; }
cx_add() { cx add "$work/add.PDB" "Name=Zoe Bench" Quantity=4711; }
cx_resave_room() { cx resave "$work/add.PDB"; }
nothing() { :; }

# step NAME CX_PREP CX OTHER_PREP OTHER
step() {
  local name=$1 cxprep=$2 cxrun=$3 otprep=$4 otrun=$5 a b
  local -a cxs=() ots=() ratios=() cpus=() otcpus=()
  $cxprep; $cxrun >/dev/null 2>&1; $otprep; $otrun >/dev/null 2>&1
  for ((i = 0; i < runs; i++)); do
    $cxprep; timed a $cxrun; cpus+=("$CPU_MS")
    $otprep; timed b $otrun; otcpus+=("$CPU_MS")
    cxs+=("$a"); ots+=("$b")
    ratios+=("$(awk -v a="$a" -v b="$b" 'BEGIN { printf "%.3f", a / b }')")
  done
  local mc mo lo hi mcpu ocpu
  mc=$(printf '%s\n' "${cxs[@]}" | median)
  mo=$(printf '%s\n' "${ots[@]}" | median)
  mcpu=$(printf '%s\n' "${cpus[@]}" | median)
  ocpu=$(printf '%s\n' "${otcpus[@]}" | median)
  lo=$(printf '%s\n' "${ratios[@]}" | sort -n | head -1)
  hi=$(printf '%s\n' "${ratios[@]}" | sort -n | tail -1)
  printf '| %-6s | %7.1f | %7.1f | %5.2f | %4.2f-%4.2f | %5.0f | %5.0f |\n' "$name" \
    "$(echo "$mc / 1000" | bc -l)" "$(echo "$mo / 1000" | bc -l)" \
    "$(echo "$mc / $mo" | bc -l)" "$lo" "$hi" "$mcpu" "$ocpu"
}

echo "65504 records, $(stat -c %s "$work/data.PDB") bytes; sqlite3 $(sqlite3 --version | cut -d' ' -f1);" \
  "$runs rounds; load average $(cut -d' ' -f1-3 /proc/loadavg)"
echo "| step | Cardovex ms | other ms | ratio of medians | per-round ratios | Cardovex CPU ms | other CPU ms |"
echo "|---|---:|---:|---:|---:|---:|---:|"
step export nothing cx_export nothing sq_export
step sort cx_sort_prep cx_sort sq_sort_prep sq_sort
step resave nothing cx_resave cp_prep cp_sync
step add add_prep cx_add add_prep cx_resave_room
cmp -s "$work/data.csv" "$work/out.csv" || { echo "the export differs from the first one" >&2; exit 1; }
