#!/bin/sh
# Runs a command with HOME and the XDG user folders in a fresh temporary folder,
# removed afterwards, so nothing touches the real user's presets or preferences.
home="$(mktemp -d)"
trap 'rm -rf "$home"' EXIT
HOME="$home" XDG_CONFIG_HOME="$home/.config" XDG_DATA_HOME="$home/.local/share" XDG_CACHE_HOME="$home/.cache" "$@"
