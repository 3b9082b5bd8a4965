#!/usr/bin/env bash
# Configures and builds every format, the tools and the tests into build/.
set -euo pipefail
root="$(cd "$(dirname "$0")/.." && pwd)"
export CCACHE_BASEDIR="$root"
cmake -S "$root" -B "$root/build" -DCMAKE_BUILD_TYPE=Release "$@"
cmake --build "$root/build" -j"$(nproc)"
