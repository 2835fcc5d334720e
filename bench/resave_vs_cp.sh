#!/usr/bin/env bash
# Times `cardovex-cli resave` of a 65504-record database as a whole process
# against `cp` of the same file followed by `sync` of the copy, and reports
# the peak memory of the resave against the file's size.
#   bench/resave_vs_cp.sh [BUILD_DIR] [RUNS]
set -euo pipefail
build="${1:-build}"
runs="${2:-15}"
cli="$build/cli/cardovex-cli"
gen="$build/bench/cardovex-generate"
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT

"$gen" "$work/big.PDB" 65504 1 >/dev/null
size=$(stat -c %s "$work/big.PDB")
"$cli" resave "$work/big.PDB"  # warm the page cache

median() { sort -n | awk '{a[NR]=$1} END {print (NR%2) ? a[(NR+1)/2] : (a[NR/2]+a[NR/2+1])/2}'; }
now() { date +%s.%N; }

resave=() copy=() peak=0
for ((i = 0; i < runs; i++)); do
  t0=$(now)
  /usr/bin/time -f "%M" -o "$work/mem" "$cli" resave "$work/big.PDB"
  t1=$(now)
  rm -f "$work/copy.PDB"
  t2=$(now)
  cp "$work/big.PDB" "$work/copy.PDB" && sync "$work/copy.PDB"
  t3=$(now)
  resave+=("$(echo "$t1 - $t0" | bc -l)")
  copy+=("$(echo "$t3 - $t2" | bc -l)")
  kb=$(cat "$work/mem")
  ((kb > peak)) && peak=$kb
done
r=$(printf '%s\n' "${resave[@]}" | median)
c=$(printf '%s\n' "${copy[@]}" | median)
printf 'file: %d records, %.1f MB\n' 65504 "$(echo "$size / 1048576" | bc -l)"
printf 'resave (median of %d): %.1f ms\n' "$runs" "$(echo "$r * 1000" | bc -l)"
printf 'cp + sync (median):     %.1f ms\n' "$(echo "$c * 1000" | bc -l)"
printf 'ratio resave / (cp + sync): %.2f\n' "$(echo "$r / $c" | bc -l)"
printf 'peak memory of resave: %.1f MB = %.2f x the file\n' "$(echo "$peak / 1024" | bc -l)" \
  "$(echo "$peak * 1024 / $size" | bc -l)"
