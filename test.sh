#!/usr/bin/env bash
# Installs what is missing, builds everything and runs the whole test suite: the
# sanitizer builds (AddressSanitizer + UndefinedBehaviorSanitizer over the unit and
# host-style suites, ThreadSanitizer over the concurrency tests, a bounded fuzzing
# run of state and preset loading), then every test of the release build. Prints
# the time each stage took.
set -euo pipefail
root="$(cd "$(dirname "$0")" && pwd)"
timings=""
stage() { # name, command...
    local name="$1" start=$SECONDS; shift
    "$@"
    timings+="$(printf '%-22s %5d s' "$name" $((SECONDS - start)))"$'\n'
}
stage "install" "$root/tools/install-dependencies.sh"
stage "build" "$root/tools/build.sh"
stage "sanitizer suite" "$root/tools/run-sanitizer-suite.sh"
stage "tsan + fuzzing" "$root/tools/run-sanitizer-checks.sh" 30
stage "release suite" bash -c "cd '$root/build' && ctest --output-on-failure -j2"
printf 'time per stage:\n%s' "$timings"
