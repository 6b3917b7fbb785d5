#!/usr/bin/env bash
# Runs every benchmark of a build folder; each prints `figure` and `ratio` lines.
set -euo pipefail
build=${1:-build}
shopt -s nullglob
found=0
for b in "$build"/bench/bench_*; do
    [ -f "$b" ] && [ -x "$b" ] || continue
    found=1
    echo "== $(basename "$b")"
    QT_QPA_PLATFORM=${QT_QPA_PLATFORM:-offscreen} "$b"
done
[ "$found" = 1 ] || echo "no benchmarks built"
