#!/usr/bin/env bash
# Every factory preset on veltrane-render's built-in signal at 48 kHz: the output
# is finite (the tool refuses anything else) and peaks below +6 dBFS.
set -euo pipefail
render="$1"; presets="$2"
work="$(mktemp -d)"; trap 'rm -rf "$work"' EXIT
export HOME="$work" XDG_CONFIG_HOME="$work/.config"
for preset in "$presets"/*.vtp; do
    peak="$("$render" --rate 48000 --preset "$preset" --output "$work/out.wav" | sed -n 's/.* peak \(.*\) dBFS, rms.*/\1/p')"
    awk -v p="$peak" 'BEGIN { exit !(p != "" && p < 6) }' || { echo "FAILED: $(basename "$preset") peaks at $peak dBFS"; exit 1; }
done
