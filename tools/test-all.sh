#!/bin/sh
# Sets up, builds and tests every build: linux (ASan+UBSan), linux-i386 (under qemu-i386),
# windows-i686 (the shipped DLL, static checks) and windows-x64 (under Wine).
set -eu
cd "$(dirname "$0")/.."
tools/setup.sh
presets=${HV_PRESETS:-"linux linux-i386 windows-i686 windows-x64"}
cleanup() { PATH=/usr/lib/wine:$PATH WINEPREFIX="$PWD/build/windows-x64/wine-prefix" wineserver -k 2>/dev/null || true; }
trap cleanup EXIT
status=0
for p in $presets; do
  echo "=== $p"
  cmake --preset "$p" >/dev/null
  cmake --build --preset "$p"
  ctest --preset "$p" -j2 || status=1
done
exit $status
