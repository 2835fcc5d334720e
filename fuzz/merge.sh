#!/bin/sh
# Folds what fuzzing found (build-fuzz/fuzz-corpus/TARGET) into the corpus
# kept in the repository, minimised: besides the seed-* files, libFuzzer
# keeps only the inputs that reach code no other input reaches, smallest
# first (edges only, not hit counts, which keeps the corpora to a few
# hundred small files). Run after scripts/fuzz or a long run.
#
#   fuzz/merge.sh [BUILD_DIR] [TARGET...]      (default: build-fuzz, all)
set -eu
cd "$(dirname "$0")/.."
BUILD=${1:-build-fuzz}
[ $# -gt 0 ] && shift
TARGETS=${*:-open ops csv obex}
for t in $TARGETS; do
  fuzzer="$BUILD/fuzz/fuzz_$t"
  [ -x "$fuzzer" ] || { echo "no $fuzzer: run scripts/fuzz first" >&2; exit 2; }
  merged=$(mktemp -d)
  mkdir -p "$BUILD/fuzz-corpus/$t"
  # The seeds stay, whatever their coverage: inputs the program's own
  # writers make (cardovex_make_seeds) are the base every run starts from.
  cp "fuzz/corpus/$t"/seed-* "$merged"/ 2>/dev/null || true
  "$fuzzer" -merge=1 -use_counters=0 -rss_limit_mb=2048 -timeout=10 "$merged" \
    "fuzz/corpus/$t" "$BUILD/fuzz-corpus/$t" >/dev/null 2>&1
  rm -f "fuzz/corpus/$t"/*
  cp "$merged"/* "fuzz/corpus/$t"/
  rm -rf "$merged"
  echo "$t: $(ls "fuzz/corpus/$t" | wc -l) inputs, $(du -sk "fuzz/corpus/$t" | cut -f1) KB"
done
