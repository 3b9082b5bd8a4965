#!/usr/bin/env bash
# veltrane-render from the command line: good renders succeed, every kind of bad
# input gives one line on stderr, a non-zero exit and no output file.
set -uo pipefail
render="$1"
work="$(mktemp -d)"; trap 'rm -rf "$work"' EXIT
export HOME="$work/home" XDG_CONFIG_HOME="$work/home/.config"; mkdir -p "$HOME"
cd "$work"

passed=0; failed=0
pass() { passed=$((passed + 1)); }
fail() { failed=$((failed + 1)); echo "FAILED: $*"; }

succeeds() { # description, args...
    local what="$1"; shift
    if "$render" "$@" >stdout.txt 2>stderr.txt; then pass; else fail "$what"; cat stderr.txt; fi
}

refuses() { # description, expected text on stderr, args...
    local what="$1" expected="$2"; shift 2
    rm -f refused.wav
    "$render" --output refused.wav "$@" >stdout.txt 2>stderr.txt
    local status=$?
    if [ $status -ne 0 ] && [ "$(wc -l <stderr.txt)" -eq 1 ] && grep -qF "$expected" stderr.txt && [ ! -e refused.wav ] && [ $status -lt 128 ]; then
        pass
    else
        fail "$what (exit $status)"; cat stderr.txt
    fi
}

succeeds "built-in signal renders" --output builtin.wav --plot builtin.png
grep -q "builtin.wav: 6.000 s, 2 ch, 44100 Hz, peak" stdout.txt && pass || fail "one-line summary"; cat stdout.txt
test -s builtin.png && pass || fail "plot written"

succeeds "a given WAV renders at another rate and block size" --input builtin.wav --output again.wav --block 100 --tail 0.5 MixMode=0.833333 Delay1Time=0.2 Delay2Time=0.38
test -s again.wav && pass || fail "WAV from WAV written"

succeeds "--info lists 33 parameters" --info
grep -q "name: Veltrane" stdout.txt && grep -q "vendor: Tarnwell_Audio" stdout.txt && grep -q "parameters: 33" stdout.txt \
    && grep -q "32 LFO2SyncedRate = .* (1/4)" stdout.txt && pass || fail "--info content"

printf '<?xml version="1.0" encoding="UTF-8"?>\n<VELTRANE_PRESET PresetName="Wide" MixMode="0.833333" DryWet="0.5"/>\n' > wide.vtp
succeeds "a preset file applies" --preset wide.vtp --output preset.wav --tail 0

refuses "unknown argument" "unknown argument" --frobnicate
refuses "missing option value" "missing value" --rate
refuses "bad sample rate" "bad value for --rate" --rate abc
refuses "zero block size" "bad value for --block" --block 0
refuses "unknown parameter" "unknown parameter: NoSuchThing" NoSuchThing=0.5
refuses "parameter out of range" "bad parameter value" Delay1Time=1.5
refuses "missing input" "input file not found" --input nothing-here.wav
echo "not audio" > notaudio.wav
refuses "unreadable input" "cannot read audio" --input notaudio.wav
refuses "missing preset" "preset file not found" --preset nothing.vtp
echo "<OTHER/>" > other.vtp
refuses "foreign preset" "not a Veltrane preset" --preset other.vtp
refuses "missing state" "cannot read state file" --state nothing.bin
refuses "missing plug-in" "plug-in not found" --plugin /nonexistent/libVeltrane.so
refuses "not a plug-in" "not a loadable VST2 plug-in" --plugin notaudio.wav
refuses "unwritable output" "cannot write" --output /nonexistent-folder/out.wav
# an unwritable output must not leave a partial file either
test ! -e /nonexistent-folder/out.wav && pass || fail "no partial output"

echo "$passed passed, $failed failed"
[ "$failed" -eq 0 ]
