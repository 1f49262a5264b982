#!/bin/sh
# Installs every Debian package the four builds and their tests need. Idempotent; run as root
# (or with sudo) on Debian 12.
set -eu
packages="
  build-essential cmake ninja-build git python3 python3-pefile
  g++-multilib qemu-user
  g++-mingw-w64-i686 g++-mingw-w64-x86-64 binutils-mingw-w64-i686 binutils-mingw-w64-x86-64
  wine64 wine
  libgtest-dev googletest libbenchmark-dev
  clang libclang-rt-14-dev
"
missing=""
for p in $packages; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q 'install ok installed' || missing="$missing $p"
done
if [ -n "$missing" ]; then
  SUDO=""
  [ "$(id -u)" -eq 0 ] || SUDO=sudo
  $SUDO apt-get update
  # shellcheck disable=SC2086
  DEBIAN_FRONTEND=noninteractive $SUDO apt-get install -y --no-install-recommends $missing
fi
echo "setup: all build and test packages are installed"
