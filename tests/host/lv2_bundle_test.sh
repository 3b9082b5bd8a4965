#!/usr/bin/env bash
# The LV2 bundle as Debian's LV2 tools see it: its Turtle parses and validates against the LV2 standard's
# own bundles (never other installed plug-ins); the manifest's version; lv2info finds it under its URI.
set -uo pipefail
bundle="$1"; uri="$2"
work="$(mktemp -d)"; trap 'rm -rf "$work"' EXIT
export HOME="$work" LV2_PATH="$(dirname "$bundle")"
failed=0
check() { "${@:2}" >"$work/out.txt" 2>&1 || { failed=1; echo "FAILED: $1"; cat "$work/out.txt"; }; }
for ttl in "$bundle"/*.ttl; do
    check "$(basename "$ttl") parses" serdi -q -i turtle -o ntriples "$ttl"
done
# JUCE 7 writes three kinds of statement the schemas do not foresee, all read by hosts as intended: port
# properties on its patch parameters, doap:release and doap:maintainer, its UI among the features.
check "sord_validate finds nothing unexpected" bash -c "sord_validate \$(dpkg -L lv2-dev | grep '^/usr/lib/lv2/.*\.ttl\$') '$bundle'/*.ttl 2>&1 \
    | grep -A3 '^error' | grep -v '^--' | paste - - - - \
    | grep -v -E 'lv2core#Port>.*lv2core#portProperty|doap#Project>.*doap#(release|maintainer)|lv2core#(Feature|ExtensionData)>.*veltrane:UI' \
    | tee /dev/stderr | wc -l | grep -qx 0"
check "33 parameters with subjects of their own" bash -c "test \$(grep -c '^plug:.*' '$bundle/dsp.ttl') -ge 33 && ! grep -q '^plug:_\$' '$bundle/dsp.ttl'"
# Hosts compare installed copies by the manifest's minor and micro version (the URI stands for the major).
check "the manifest carries 1.2.1" bash -c "serdi -i turtle -o ntriples '$bundle/manifest.ttl' | grep -F -e 'minorVersion> \"2\"' -e 'microVersion> \"1\"' | wc -l | grep -qx 2"
check "lv2info shows the name under the absolute URI" bash -c "lv2info '$uri' | grep -q 'Name:.*Veltrane'"
exit $failed
