#!/usr/bin/env bash
# Builds the unit and host-style test suites with AddressSanitizer and
# UndefinedBehaviorSanitizer into build-asan/ and runs them there.
set -euo pipefail
root="$(cd "$(dirname "$0")/.." && pwd)"
build="$root/build-asan"
export CCACHE_BASEDIR="$root"

mkdir -p "$build"
cmake -S "$root" -B "$build" -DCMAKE_BUILD_TYPE=RelWithDebInfo -DVELTRANE_SANITIZE=address,undefined \
      -DVELTRANE_BUILD_BENCHMARKS=OFF > "$build/configure.log"
cmake --build "$build" -j"$(nproc)" --target veltrane_sanitized_tests > "$build/build.log" || { tail -50 "$build/build.log"; exit 1; }

export ASAN_OPTIONS="detect_leaks=1:abort_on_error=1:strict_string_checks=1:detect_stack_use_after_return=1"
export UBSAN_OPTIONS="halt_on_error=1:print_stacktrace=1"
cd "$build"
ctest --output-on-failure -j2 -L sanitized
