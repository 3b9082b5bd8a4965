#!/usr/bin/env bash
# The LV2 bundle as Debian's LV2 tools see it: its Turtle parses, lilv finds the
# plug-in under its absolute URI with its audio ports.
set -uo pipefail
bundle="$1"; uri="$2"
work="$(mktemp -d)"; trap 'rm -rf "$work"' EXIT
export HOME="$work/home" XDG_CONFIG_HOME="$work/home/.config"; mkdir -p "$HOME"
export LV2_PATH="$(dirname "$bundle")"

passed=0; failed=0
check() { # description, command...
    local what="$1"; shift
    if "$@" >"$work/out.txt" 2>&1; then passed=$((passed + 1)); else failed=$((failed + 1)); echo "FAILED: $what"; cat "$work/out.txt"; fi
}

for ttl in "$bundle"/*.ttl; do
    check "$(basename "$ttl") parses as Turtle" serdi -q -i turtle -o ntriples "$ttl"
done
check "lv2ls lists the absolute URI" bash -c "lv2ls | grep -Fx '$uri'"
check "lv2info shows name and ports" bash -c "lv2info '$uri' > '$work/info.txt' && grep -q 'Name:.*Veltrane' '$work/info.txt' && grep -q 'Class:.*Delay\|Class:.*Plugin' '$work/info.txt' && test \$(grep -c 'Type:.*Audio' '$work/info.txt') -ge 1"

echo "$passed passed, $failed failed"
[ "$failed" -eq 0 ]
