#!/usr/bin/env bash
# Copies the built plug-in into the per-user plug-in folders that hosts scan.
set -euo pipefail
artefacts="$(cd "$(dirname "$0")/.." && pwd)/build/Veltrane_artefacts/Release"
mkdir -p "$HOME/.vst" "$HOME/.vst3" "$HOME/.lv2"
cp -f "$artefacts/VST/Veltrane.so" "$HOME/.vst/Veltrane.so"
rm -rf "$HOME/.vst3/Veltrane.vst3" "$HOME/.lv2/Veltrane.lv2"
cp -r "$artefacts/VST3/Veltrane.vst3" "$HOME/.vst3/"
cp -r "$artefacts/LV2/Veltrane.lv2" "$HOME/.lv2/"
echo "Installed Veltrane into ~/.vst, ~/.vst3 and ~/.lv2"
