#!/bin/sh
# Builds the fuzz targets with clang, writes the seed corpus and runs every target.
# Usage: fuzz/run.sh [seconds per target, default 20] [build folder, default /tmp/quillane-fuzz]
#        [most runs per target, default no limit]
set -eu
seconds=${1:-20}
build=${2:-/tmp/quillane-fuzz}
runs=${3:--1}
source=$(cd "$(dirname "$0")/.." && pwd)
families="jpeg bmp ico gif png wmf emf exif stdin"

cmake -S "$source" -B "$build" -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++ \
  -DCMAKE_BUILD_TYPE=RelWithDebInfo -DQUILLANE_FUZZ=ON -DQUILLANE_GUI=OFF -DQUILLANE_BENCH=OFF
targets=quillane_fuzz_seeds
for family in $families; do targets="$targets fuzz_$family"; done
# shellcheck disable=SC2086
cmake --build "$build" -j2 --target $targets

"$build/fuzz/quillane_fuzz_seeds" "$build/fuzz/seeds"
status=0
for family in $families; do
  corpus="$build/fuzz/corpus/$family"
  mkdir -p "$corpus" "$build/fuzz/crashes"
  echo "== fuzz_$family for ${seconds}s"
  if ! "$build/fuzz/fuzz_$family" -max_total_time="$seconds" -runs="$runs" -timeout=10 -rss_limit_mb=2048 \
      -artifact_prefix="$build/fuzz/crashes/$family-" -print_final_stats=1 \
      "$corpus" "$build/fuzz/seeds/$family"; then
    echo "fuzz_$family FAILED: see $build/fuzz/crashes/"
    status=1
  fi
done
exit $status
