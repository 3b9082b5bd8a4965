#!/usr/bin/env bash
# Installs what is missing, builds everything and runs the whole test suite: the
# sanitizer builds (AddressSanitizer + UndefinedBehaviorSanitizer over the unit and
# host-style suites, ThreadSanitizer over the concurrency tests, a bounded fuzzing
# run of state and preset loading), then every test of the release build.
set -euo pipefail
root="$(cd "$(dirname "$0")" && pwd)"
"$root/tools/install-dependencies.sh"
"$root/tools/build.sh"
"$root/tools/run-sanitizer-suite.sh"
"$root/tools/run-sanitizer-checks.sh" 30
cd "$root/build"
ctest --output-on-failure -j2
