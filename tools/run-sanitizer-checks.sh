#!/usr/bin/env bash
# Builds and runs the sanitizer checks of the persistence code: the concurrency test
# under ThreadSanitizer and a bounded libFuzzer run (AddressSanitizer) of state and
# preset loading. Prints one summary line; exits non-zero when a check fails.
#
#   tools/run-sanitizer-checks.sh [fuzz seconds per target, default 30]
set -uo pipefail
root="$(cd "$(dirname "$0")/.." && pwd)"
fuzzSeconds="${1:-30}"
export CCACHE_BASEDIR="${CCACHE_BASEDIR:-$root}"
lock=/tmp/veltrane-build.lock
tsanDir="$root/build-tsan"
fuzzDir="$root/build-fuzz"
logs="$root/build-sanitizer-logs"
mkdir -p "$logs"
tsan=FAIL
fuzz=FAIL

# The concurrency test with ThreadSanitizer (built with the project's sanitizer option).
if cmake -S "$root" -B "$tsanDir" -DCMAKE_BUILD_TYPE=Release -DVELTRANE_SANITIZE=thread \
        -DVELTRANE_BUILD_BENCHMARKS=OFF >"$logs/tsan-configure.log" 2>&1 \
    && flock "$lock" cmake --build "$tsanDir" -j2 --target veltrane_concurrency_tests >"$logs/tsan-build.log" 2>&1
then
    home="$(mktemp -d)"
    if HOME="$home" TSAN_OPTIONS="halt_on_error=1 exitcode=66 second_deadlock_stack=1" \
        "$tsanDir/tests/veltrane_concurrency_tests" >"$logs/tsan-run.log" 2>&1; then
        tsan=PASS
    fi
    rm -rf "$home"
fi

# The fuzz targets: juce_core and the persistence code built with clang's libFuzzer.
if CC=clang CXX=clang++ cmake -S "$root/tests/fuzz" -B "$fuzzDir" -DCMAKE_BUILD_TYPE=RelWithDebInfo \
        >"$logs/fuzz-configure.log" 2>&1 \
    && flock "$lock" cmake --build "$fuzzDir" -j2 >"$logs/fuzz-build.log" 2>&1
then
    fuzz=PASS
    for target in state preset; do
        corpus="$(mktemp -d)"
        home="$(mktemp -d)"
        if ! HOME="$home" ASAN_OPTIONS="detect_leaks=1" "$fuzzDir/veltrane_fuzz_$target" \
                -max_total_time="$fuzzSeconds" -rss_limit_mb=2048 -timeout=10 -max_len=65536 \
                -artifact_prefix="$logs/$target-" "$corpus" "$root/tests/fuzz/corpus/$target" \
                >"$logs/fuzz-$target.log" 2>&1; then
            fuzz=FAIL
        fi
        rm -rf "$corpus" "$home"
    done
fi

echo "sanitizer checks: tsan concurrency $tsan, fuzz state+preset ${fuzzSeconds}s each $fuzz (logs in $logs)"
[ "$tsan" = PASS ] && [ "$fuzz" = PASS ]
