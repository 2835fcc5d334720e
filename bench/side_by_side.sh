#!/bin/sh
# Cardovex and sqlite3 side by side on the same data, each step as the
# command a user would run (cardovex-cli, the sqlite3 shell), each its own
# process that opens its file and, where the step changes data, writes it
# back:
#
#   import  the same CSV file into an empty database (Cardovex: a database
#           of the generated design; sqlite3: a table with one column per
#           field, Quantity an integer)
#   sort    on City, Quantity (descending), Name, keeping the sorted order
#           in the file (sqlite3: the table rewritten in that order)
#   filter  Name contains "an" AND 100 <= Quantity <= 50000, counting the
#           records that pass (Cardovex stores the filters, as its dialog
#           does)
#   export  the records that pass, in sorted order, as CSV
#
# Every step runs three times from the same starting files; the fastest
# counts. The exports of both must hold the same records. Prints each
# step's times and the ratio Cardovex / sqlite3 (below 1: Cardovex faster).
#
#   bench/side_by_side.sh [BUILD_DIR] [RECORDS]      (default: build 65504)
set -eu

BUILD=${1:-build}
RECORDS=${2:-65504}
CLI="$BUILD/cli/cardovex-cli"
GEN="$BUILD/bench/cardovex-generate"
for tool in "$CLI" "$GEN"; do
  [ -x "$tool" ] || { echo "build the targets cardovex-cli and cardovex-generate in $BUILD first" >&2; exit 2; }
done
command -v sqlite3 >/dev/null || { echo "sqlite3 is not installed" >&2; exit 2; }
command -v python3 >/dev/null || { echo "python3 is needed to compare the exports" >&2; exit 2; }

WORK=$(mktemp -d)
trap 'rm -rf "$WORK"' EXIT INT TERM
cx() { LC_ALL=C "$CLI" --date-format M/d/yyyy --time-format "h:mm:ss tt" --decimal . "$@"; }
now_ns() { date +%s%N; }

# step NAME PREPARE COMMAND: runs PREPARE (untimed) then COMMAND, three
# times; leaves the fastest time in milliseconds (3 decimals) in $BEST.
step() {
  name=$1 prepare=$2 command=$3
  BEST=
  for run in 1 2 3; do
    $prepare
    start=$(now_ns)
    $command >/dev/null
    elapsed=$(( $(now_ns) - start ))
    if [ -z "$BEST" ] || [ "$elapsed" -lt "$BEST" ]; then BEST=$elapsed; fi
  done
  BEST=$(awk -v n="$BEST" 'BEGIN { printf "%.1f", n / 1e6 }')
}

echo "Cardovex vs sqlite3 $(sqlite3 --version | cut -d' ' -f1), $RECORDS records"
echo "Machine: $(nproc) cores, $(grep -m1 'model name' /proc/cpuinfo | cut -d: -f2 | sed 's/^ *//'), $(date -u '+%Y-%m-%d %H:%M UTC')"

# The shared input: a generated database exported by Cardovex.
"$GEN" "$WORK/data.PDB" "$RECORDS" 7
"$GEN" "$WORK/design.PDB" 0 7
cx export-csv "$WORK/data.PDB" "$WORK/data.csv" >/dev/null
echo "Input: $(wc -c < "$WORK/data.csv") bytes of CSV"
echo

COLUMNS="name, quantity integer, price, color, paid, id, photo, born, at, customer, orderno,
  notes, details, supplier, total, running, city, rating"
ORDER="city collate nocase, quantity desc, name collate nocase"
WHERE="name like '%an%' and quantity between 100 and 50000"

# import
cx_import_prepare() { cp "$WORK/design.PDB" "$WORK/work.PDB"; }
cx_import() { cx import-csv "$WORK/work.PDB" "$WORK/data.csv"; }
sq_import_prepare() { rm -f "$WORK/work.db"; }
sq_import() { sqlite3 "$WORK/work.db" "create table items($COLUMNS);" ".mode csv" ".import $WORK/data.csv items"; }
step import cx_import_prepare cx_import; CX_IMPORT=$BEST
cp "$WORK/work.PDB" "$WORK/imported.PDB"
step import sq_import_prepare sq_import; SQ_IMPORT=$BEST
cp "$WORK/work.db" "$WORK/imported.db"

# sort
cx_sort_prepare() { cp "$WORK/imported.PDB" "$WORK/work.PDB"; }
cx_sort() { cx sort "$WORK/work.PDB" City Quantity:reverse Name; }
sq_sort_prepare() { cp "$WORK/imported.db" "$WORK/work.db"; }
sq_sort() {
  sqlite3 "$WORK/work.db" "begin; create table sorted as select * from items order by $ORDER;
    drop table items; alter table sorted rename to items; commit;"
}
step sort cx_sort_prepare cx_sort; CX_SORT=$BEST
cp "$WORK/work.PDB" "$WORK/sorted.PDB"
step sort sq_sort_prepare sq_sort; SQ_SORT=$BEST
cp "$WORK/work.db" "$WORK/sorted.db"

# filter
cx_filter_prepare() { cp "$WORK/sorted.PDB" "$WORK/work.PDB"; }
cx_filter() { cx filter "$WORK/work.PDB" --filter1 Name=an --filter2 Quantity=100..50000; }
sq_filter_prepare() { :; }
sq_filter() { sqlite3 "$WORK/sorted.db" "select count(*) from items where $WHERE;"; }
step filter cx_filter_prepare cx_filter; CX_FILTER=$BEST
step filter sq_filter_prepare sq_filter; SQ_FILTER=$BEST

# export
nothing() { :; }
cx_export() { cx export-csv "$WORK/work.PDB" "$WORK/cardovex.csv" --filtered; }
sq_export() { sqlite3 "$WORK/sorted.db" ".mode csv" ".output $WORK/sqlite.csv" "select * from items where $WHERE;"; }
step export nothing cx_export; CX_EXPORT=$BEST
step export nothing sq_export; SQ_EXPORT=$BEST

# Both must have found and written the same records.
SQ_COUNT=$(sq_filter)
python3 - "$WORK/cardovex.csv" "$WORK/sqlite.csv" "$SQ_COUNT" <<'EOF'
import csv, sys
def rows(path):
    with open(path, newline="", encoding="cp1252") as f:
        return sorted((r[0], r[1], r[16]) for r in csv.reader(f))
a, b = rows(sys.argv[1]), rows(sys.argv[2])
if a != b or len(a) != int(sys.argv[3]):
    sys.exit("the exports differ: Cardovex %d records, sqlite3 %d (count %s)" % (len(a), len(b), sys.argv[3]))
EOF
echo "Both found and exported the same $SQ_COUNT records."
echo

ratio() { awk -v a="$1" -v b="$2" 'BEGIN { printf "%.2f", a / (b > 0 ? b : 0.001) }'; }
total() { awk -v a="$1" -v b="$2" -v c="$3" -v d="$4" 'BEGIN { printf "%.1f", a + b + c + d }'; }
CX_TOTAL=$(total "$CX_IMPORT" "$CX_SORT" "$CX_FILTER" "$CX_EXPORT")
SQ_TOTAL=$(total "$SQ_IMPORT" "$SQ_SORT" "$SQ_FILTER" "$SQ_EXPORT")
printf '| %-7s | %12s | %11s | %17s |\n' step "Cardovex ms" "sqlite3 ms" "Cardovex/sqlite3"
printf '|---------|-------------:|------------:|------------------:|\n'
for s in import sort filter export total; do
  case $s in
    import) a=$CX_IMPORT b=$SQ_IMPORT ;;
    sort) a=$CX_SORT b=$SQ_SORT ;;
    filter) a=$CX_FILTER b=$SQ_FILTER ;;
    export) a=$CX_EXPORT b=$SQ_EXPORT ;;
    total) a=$CX_TOTAL b=$SQ_TOTAL ;;
  esac
  printf '| %-7s | %12s | %11s | %17s |\n' "$s" "$a" "$b" "$(ratio "$a" "$b")"
done
