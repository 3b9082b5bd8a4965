#!/usr/bin/env bash
# The Debian package, made by CPack from this build into a temporary folder (gzip instead of xz, for speed):
# its file list, every format loaded from the tree it unpacks to (never installed here), no lintian error.
set -uo pipefail
build="$1"; lv2tests="$2"
work="$(mktemp -d)"; trap 'rm -rf "$work"' EXIT
export HOME="$work/home" XDG_CONFIG_HOME="$work/home/.config"; mkdir -p "$HOME"

failed=0
check() { "${@:2}" >"$work/out.txt" 2>&1 || { failed=1; echo "FAILED: $1"; cat "$work/out.txt"; }; }

cpack --config "$build/CPackConfig.cmake" -B "$work/deb" -D CPACK_VELTRANE_COMPRESSION=gzip >"$work/cpack.txt" 2>&1 \
    || { cat "$work/cpack.txt"; exit 1; }
deb="$work/deb/veltrane_1.2.1_amd64.deb"
tree="$work/tree"
dpkg-deb -x "$deb" "$tree" || exit 1

expected=$(printf '%s\n' usr/bin/veltrane{,-render} usr/lib/lv2/Veltrane.lv2/{dsp.ttl,libVeltrane.so,manifest.ttl,ui.ttl} usr/lib/vst/Veltrane.so \
    usr/lib/vst3/Veltrane.vst3/Contents/x86_64-linux/Veltrane.so usr/share/applications/veltrane.desktop usr/share/doc/veltrane/{changelog.gz,copyright} \
    usr/share/icons/hicolor/256x256/apps/veltrane.png usr/share/man/man1/veltrane{,-render}.1.gz | LC_ALL=C sort)
check "the file list" diff <(echo "$expected") <(cd "$tree" && find . -type f -printf '%P\n' | LC_ALL=C sort)
check "no maintainer scripts: apt remove leaves no record behind" bash -c "! dpkg-deb -I '$deb' | grep -E 'preinst|postinst|prerm|postrm'"
check "dependencies computed from the binaries" bash -c "dpkg-deb -f '$deb' Depends | grep -q 'libc6 (>='"
render="$tree/usr/bin/veltrane-render"
check "veltrane-render finds the VST2 plug-in beside it" bash -c "cd / && PATH='$tree/usr/bin' veltrane-render --info | grep -qx 'file: $tree/usr/lib/vst/Veltrane.so'"
check "the VST2 plug-in renders" "$render" --plugin "$tree/usr/lib/vst/Veltrane.so" --output "$work/vst2.wav"
check "the VST3 plug-in renders" "$render" --plugin "$tree/usr/lib/vst3/Veltrane.vst3" --output "$work/vst3.wav"
check "the LV2 plug-in runs in lilv" env VELTRANE_TEST_LV2_PATH="$tree/usr/lib/lv2" "$lv2tests"
check "the application finds its libraries" bash -c "ldd '$tree/usr/bin/veltrane' && ! ldd '$tree/usr/bin/veltrane' | grep -q 'not found'"
check "lintian reports no error" bash -c "lintian '$deb' | tee '$work/lintian.txt'; ! grep '^E:' '$work/lintian.txt'"
exit $failed
