#!/usr/bin/env bash
# Builds the libFuzzer targets with clang under AddressSanitizer and UndefinedBehaviorSanitizer and replays
# every seed corpus once. Fails on the first crash, leak or sanitizer report.
set -euo pipefail
cd "$(dirname "$0")/.."
build=${FUZZ_BUILD:-build-fuzz}
if ! ls fuzz/*/CMakeLists.txt >/dev/null 2>&1; then
    echo "no fuzz targets"
    exit 0
fi
cmake -S . -B "$build" -G Ninja -DCMAKE_CXX_COMPILER=clang++ -DCMAKE_BUILD_TYPE=RelWithDebInfo \
    -DBRIMVAULT_BUILD_FUZZ=ON -DBRIMVAULT_BUILD_TESTS=OFF -DBRIMVAULT_BUILD_BENCH=OFF \
    -DBRIMVAULT_SANITIZE=address,undefined >/dev/null
cmake --build "$build" --target brimvault_fuzzers
export UBSAN_OPTIONS=halt_on_error=1:print_stacktrace=1
for target in "$build"/fuzz/fuzz_*; do
    [ -x "$target" ] || continue
    name=$(basename "$target")
    corpus=fuzz/corpus/${name#fuzz_}
    [ -d "$corpus" ] || { echo "no corpus for $name"; exit 1; }
    echo "== $name ($(ls "$corpus" | wc -l) inputs)"
    "$target" -runs=0 "$corpus" 2>&1 | tail -n 2
done
