#!/usr/bin/env bash
# Counts the lines of C++, shell and CMake in the repository: the tests (everything
# under tests/ but the fuzz corpora) against the code (everything else), and prints
# the ratio. Data files (presets, pictures, corpora) are not counted.
#
#   tools/count-lines.sh [--max RATIO]   exits 1 when tests/code exceeds RATIO
set -euo pipefail
cd "$(dirname "$0")/.."
max="${2:-}"
[ "${1:-}" = "--max" ] || max=""

isSource() {
    case "$1" in
        *.cpp|*.h|*.sh|*.cmake|*/CMakeLists.txt|CMakeLists.txt) return 0 ;;
        *.*) return 1 ;;
    esac
    head -n 1 "$1" 2>/dev/null | grep -q '^#!.*sh'
}

code=0; tests=0
while IFS= read -r file; do
    [ -f "$file" ] && isSource "$file" || continue
    lines=$(wc -l < "$file")
    case "$file" in
        tests/fuzz/corpus/*) ;;
        tests/*) tests=$((tests + lines)) ;;
        *) code=$((code + lines)) ;;
    esac
done < <(git ls-files 2>/dev/null || find . -type f -not -path './.git/*' -not -path './build*' | sed 's|^\./||')

ratio=$(awk -v t="$tests" -v c="$code" 'BEGIN { printf "%.3f", c ? t / c : 0 }')
echo "lines: code $code, tests $tests, tests/code $ratio"
if [ -n "$max" ] && awk -v r="$ratio" -v m="$max" 'BEGIN { exit !(r > m) }'; then
    echo "the tests exceed $max of the code"
    exit 1
fi
