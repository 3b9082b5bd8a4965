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
# Validated against the LV2 specification's own bundles (those of Debian's lv2-dev),
# never against whatever other plug-ins are installed beside them.
# JUCE 7 writes three kinds of statement the schemas do not foresee, all read by
# hosts as intended: port properties (enumeration, toggled) on its patch
# parameters, doap:release and doap:maintainer on the plug-in, and the UI named
# among the plug-in's features. Every other finding fails the test.
validate() {
    sord_validate $(dpkg -L lv2-dev | grep '^/usr/lib/lv2/.*\.ttl$') "$bundle"/*.ttl > "$work/validate.txt" 2>&1
    grep -A3 '^error' "$work/validate.txt" | grep -v '^--' | paste - - - - \
        | grep -v -E "Subject not in domain <http://lv2plug.in/ns/lv2core#Port>.*lv2core#portProperty" \
        | grep -v -E "Subject not in domain <http://usefulinc.com/ns/doap#Project>.*doap#(release|maintainer)" \
        | grep -v -E "Object not in range <http://lv2plug.in/ns/lv2core#(Feature|ExtensionData)>.*veltrane:UI" \
        > "$work/unexpected.txt"
    cat "$work/unexpected.txt"
    [ ! -s "$work/unexpected.txt" ]
}
check "sord_validate finds nothing unexpected" validate
check "every parameter has a subject of its own" bash -c "test \$(grep -c '^plug:.*' '$bundle/dsp.ttl') -ge 33 && ! grep -q '^plug:_\$' '$bundle/dsp.ttl'"
check "lv2ls lists the absolute URI" bash -c "lv2ls | grep -Fx '$uri'"
check "lv2info shows name and ports" bash -c "lv2info '$uri' > '$work/info.txt' && grep -q 'Name:.*Veltrane' '$work/info.txt' && grep -q 'Class:.*Delay\|Class:.*Plugin' '$work/info.txt' && test \$(grep -c 'Type:.*Audio' '$work/info.txt') -ge 1"

echo "$passed passed, $failed failed"
[ "$failed" -eq 0 ]
