#!/usr/bin/env bash
# Builds the reader's libFuzzer harness with clang (AddressSanitizer and
# UndefinedBehaviorSanitizer) and runs it for a bounded time.
# Usage: fuzz/run.sh [SECONDS] [extra libFuzzer options...]
set -euo pipefail
cd "$(dirname "$0")/.."
seconds=${1:-60}
shift || true
build=build/fuzz
cmake -S fuzz -B "$build" -G Ninja -DCMAKE_CXX_COMPILER=clang++ -DCMAKE_BUILD_TYPE=RelWithDebInfo >/dev/null
cmake --build "$build" -j2
# The committed seeds stay as they are; what the fuzzer finds goes elsewhere.
work="$build/corpus"
mkdir -p "$work" "$build/artifacts"
ASAN_OPTIONS=${ASAN_OPTIONS:-detect_leaks=1} UBSAN_OPTIONS=${UBSAN_OPTIONS:-print_stacktrace=1:halt_on_error=1} \
  "$build/fuzz_reader" -max_total_time="$seconds" -max_len=4096 -timeout=10 -rss_limit_mb=2048 \
  -artifact_prefix="$build/artifacts/" -print_final_stats=1 "$@" "$work" fuzz/corpus
