#!/usr/bin/env bash
# Installs what is missing, builds everything and runs the whole test suite.
set -euo pipefail
root="$(cd "$(dirname "$0")" && pwd)"
"$root/tools/install-dependencies.sh"
"$root/tools/build.sh"
cd "$root/build"
ctest --output-on-failure -j2
