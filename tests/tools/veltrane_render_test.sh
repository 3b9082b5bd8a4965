#!/usr/bin/env bash
# veltrane-render from the command line: good renders succeed with a one-line summary; the tempo reaches synced
# LFOs (120 bpm without --bpm); every factory preset stays below +6 dBFS; every kind of bad input gives one
# line on stderr, a non-zero exit and no output file.
set -uo pipefail
render="$1"; presets="$2"
work="$(mktemp -d)"; trap 'rm -rf "$work"' EXIT
export HOME="$work" XDG_CONFIG_HOME="$work/.config"; cd "$work"
failed=0
fail() { failed=1; echo "FAILED: $*"; cat stderr.txt 2>/dev/null; }

"$render" --output builtin.wav --plot builtin.png >stdout.txt 2>stderr.txt && grep -q "builtin.wav: 6.000 s, 2 ch, 44100 Hz, peak" stdout.txt \
    && test -s builtin.png || fail "built-in signal"
printf '<VELTRANE_PRESET PresetName="Wide" MixMode="0.833333" DryWet="0.5"/>' > wide.vtp
"$render" --input builtin.wav --output again.wav --block 100 --tail 0.5 --preset wide.vtp Delay1Time=0.2 >/dev/null 2>stderr.txt \
    && test -s again.wav || fail "a WAV with a preset and a parameter"
"$render" --info 2>stderr.txt | tr '\n' '|' | grep -q "name: Veltrane|.*vendor: Tarnwell_Audio|.*parameters: 33|.*32 LFO2SyncedRate = .* (1/4)" \
    || fail "--info"

synced=(--tail 0 LFO1Sync=1 Delay1TimeModSource=0.834 Delay1TimeMod=0.5 Delay1Time=0.3)
for bpm in "" 120 90; do "$render" --output "tempo$bpm.wav" ${bpm:+--bpm $bpm} "${synced[@]}" >/dev/null; done
cmp -s tempo.wav tempo120.wav && ! cmp -s tempo120.wav tempo90.wav || fail "the tempo"
for preset in "$presets"/*.vtp; do
    peak="$("$render" --rate 48000 --preset "$preset" --output preset.wav | sed -n 's/.* peak \(.*\) dBFS, rms.*/\1/p')"
    awk -v p="$peak" 'BEGIN { exit !(p != "" && p < 6) }' || fail "$(basename "$preset") peaks at $peak dBFS"
done

echo "not audio" > notaudio.wav; echo "<OTHER/>" > other.vtp
while IFS='|' read -r expected args; do
    rm -f refused.wav
    # shellcheck disable=SC2086
    "$render" --output refused.wav $args >/dev/null 2>stderr.txt; status=$?
    [ $status -ne 0 ] && [ $status -lt 128 ] && [ "$(wc -l <stderr.txt)" -eq 1 ] && grep -qF "$expected" stderr.txt && [ ! -e refused.wav ] \
        || fail "$args (exit $status)"
done <<'CASES'
unknown argument|--frobnicate
missing value|--rate
bad value for --block|--block 0
unknown parameter: NoSuchThing|NoSuchThing=0.5
bad parameter value|Delay1Time=1.5
cannot read audio|--input notaudio.wav
not a Veltrane preset|--preset other.vtp
cannot read state file|--state nothing.bin
not a loadable VST2 plug-in|--plugin notaudio.wav
cannot write|--output /nonexistent-folder/out.wav
CASES
exit $failed
