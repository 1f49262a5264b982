#!/bin/sh
# Sets up, builds Hivelet.hzx (the shipped 32-bit DLL) and the Linux host simulator, shows the
# editor's view of the events and runs the demo script in the simulator (its state file goes to
# build/).
set -eu
cd "$(dirname "$0")/.."
tools/setup.sh
for p in windows-i686 linux; do
  cmake --preset "$p" >/dev/null
  cmake --build --preset "$p"
done
echo "Built $(pwd)/build/windows-i686/bin/Hivelet.hzx"
build/linux/bin/hivelet-host menus
cd build
exec linux/bin/hivelet-host run ../scenarios/demo.hvs
