#!/usr/bin/env bash
# veltrane-render's transport: an LFO synced to the tempo moves delay 1's time, so
# renders at 120 and 90 bpm differ, and 120 is the tempo without --bpm.
set -euo pipefail
render="$1"
work="$(mktemp -d)"; trap 'rm -rf "$work"' EXIT
export HOME="$work" XDG_CONFIG_HOME="$work/.config"
synced=(--tail 0 LFO1Sync=1 Delay1TimeModSource=0.834 Delay1TimeMod=0.5 Delay1Time=0.3)
"$render" --output "$work/default.wav" "${synced[@]}" >/dev/null
"$render" --output "$work/120.wav" --bpm 120 "${synced[@]}" >/dev/null
"$render" --output "$work/90.wav" --bpm 90 "${synced[@]}" >/dev/null
cmp "$work/default.wav" "$work/120.wav"
! cmp -s "$work/120.wav" "$work/90.wav" || { echo "FAILED: the tempo changes nothing"; exit 1; }
grep -q -- "--bpm tempo" <("$render" --help 2>&1)
