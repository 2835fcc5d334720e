#!/bin/sh
# Times Cardovex's CSV export and import against sqlite3's on the same data:
# a generated database of RECORDS records (65504, the most a file can hold,
# by default). Each step runs as its own process, opening and writing its
# files, and the best of three runs counts.
#
#   bench/csv_vs_sqlite.sh [BUILD_DIR] [RECORDS]
set -eu

BUILD=${1:-build}
RECORDS=${2:-65504}
BENCH="$BUILD/bench/bench_csv"
[ -x "$BENCH" ] || { echo "build the bench_csv target in $BUILD first" >&2; exit 2; }
command -v sqlite3 >/dev/null || { echo "sqlite3 is not installed" >&2; exit 2; }

WORK=$(mktemp -d)
trap 'rm -rf "$WORK"' EXIT INT TERM

now_ms() { echo $(( $(date +%s%N) / 1000000 )); }

# best_of NAME COMMAND...: runs the command three times, prints and keeps
# the fastest wall time in milliseconds in $BEST.
best_of() {
  name=$1; shift
  BEST=
  for run in 1 2 3; do
    start=$(now_ms)
    "$@" >/dev/null
    elapsed=$(( $(now_ms) - start ))
    if [ -z "$BEST" ] || [ "$elapsed" -lt "$BEST" ]; then BEST=$elapsed; fi
  done
  printf '  %-28s %6d ms\n' "$name" "$BEST"
}

echo "Generating $RECORDS records..."
"$BENCH" --make "$RECORDS" "$WORK/data.PDB" "$WORK/data.csv"
COLUMNS=$(/usr/bin/python3 -c 'import csv, sys
print(len(next(csv.reader(open(sys.argv[1], newline="", encoding="cp1252")))))' "$WORK/data.csv")
SCHEMA="create table items($(seq -s, -f 'c%g' 1 "$COLUMNS"));"
echo "  $(wc -c < "$WORK/data.csv") bytes of CSV, $COLUMNS columns"

sqlite_import() {
  rm -f "$WORK/import.db"
  sqlite3 "$WORK/import.db" "$SCHEMA" ".mode csv" ".import $WORK/data.csv items"
}
sqlite_export() {
  sqlite3 "$WORK/export.db" ".mode csv" ".output $WORK/sqlite-out.csv" "select * from items;"
}
cardovex_import() {
  rm -f "$WORK/imported.PDB"
  "$BENCH" --import "$WORK/data.PDB" "$WORK/data.csv" "$WORK/imported.PDB"
}
cardovex_export() {
  "$BENCH" --export "$WORK/data.PDB" "$WORK/cardovex-out.csv"
}

# The database sqlite3 exports from.
sqlite3 "$WORK/export.db" "$SCHEMA" ".mode csv" ".import $WORK/data.csv items"

echo "Export:"
best_of "cardovex (open + export)" cardovex_export; CX_EXPORT=$BEST
best_of "sqlite3 (open + export)" sqlite_export; SQ_EXPORT=$BEST
echo "Import:"
best_of "cardovex (import + save)" cardovex_import; CX_IMPORT=$BEST
best_of "sqlite3 (import)" sqlite_import; SQ_IMPORT=$BEST

# Both must have all the records.
SQ_ROWS=$(sqlite3 "$WORK/import.db" "select count(*) from items;")
cmp -s "$WORK/data.csv" "$WORK/cardovex-out.csv" || { echo "export differs from the generated CSV" >&2; exit 1; }
[ "$SQ_ROWS" -eq "$RECORDS" ] || { echo "sqlite3 imported $SQ_ROWS rows" >&2; exit 1; }

ratio() { awk -v a="$1" -v b="$2" 'BEGIN { if (b == 0) b = 1; printf "%.2f", a / b }'; }
echo "Cardovex time / sqlite3 time:"
echo "  export  $(ratio "$CX_EXPORT" "$SQ_EXPORT")"
echo "  import  $(ratio "$CX_IMPORT" "$SQ_IMPORT")"
