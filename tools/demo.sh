#!/bin/sh
# Sets up and builds Hivelet.hzx (the shipped 32-bit DLL) with the 32-bit host simulator, then,
# in a 32-bit Windows process under Wine and against the very DLL that ships, shows the editor's
# view of the events and runs the demo script (its state file goes to build/windows-i686/).
# `tools/demo.sh --native` runs the same demo with the Linux build and the portable Win32 layer
# instead, which starts faster.
set -eu
cd "$(dirname "$0")/.."
root=$(pwd)
case ${1:-} in
  --native) preset=linux host=bin/hivelet-host run="" ;;
  "") preset=windows-i686 host=bin/hivelet-host.exe run=./wine-run ;;
  *) echo "usage: tools/demo.sh [--native]" >&2; exit 2 ;;
esac
tools/setup.sh
cmake --preset "$preset" >/dev/null
cmake --build --preset "$preset" --target hivelet-host
echo "Built $root/build/$preset/bin/Hivelet.hzx"
cd "build/$preset"
if [ -n "$run" ]; then
  trap 'PATH=/usr/lib/wine:$PATH WINEPREFIX="$PWD/wine-prefix" wineserver -k 2>/dev/null || true' EXIT
fi
$run $host menus
$run $host run "$root/scenarios/demo.hvs"
