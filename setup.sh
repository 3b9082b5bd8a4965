#!/usr/bin/env bash
# Installs what is missing, builds Veltrane in every format with its tools,
# installs the plug-in for the current user and renders the built-in demo signal.
set -euo pipefail
root="$(cd "$(dirname "$0")" && pwd)"
"$root/tools/install-dependencies.sh"
"$root/tools/build.sh"
"$root/tools/install-plugin.sh"

mkdir -p "$root/build/demo"
"$root/build/tools/veltrane-render" --output "$root/build/demo/veltrane-demo.wav" --plot "$root/build/demo/veltrane-demo.png"
echo "Demo written to build/demo/veltrane-demo.wav (picture: build/demo/veltrane-demo.png)"
