#!/bin/sh
# Installs every Debian package the builds and their tests need, and makes 32-bit programs run:
# i386 Linux programs and, through them, 32-bit Wine for the shipped DLL. Idempotent; run as
# root on Debian 12 by every command that builds or runs something (the binfmt registration is
# lost at every boot).
set -eu
root=$(cd "$(dirname "$0")/.." && pwd)

fail() {
  echo "setup: $*" >&2
  exit 1
}

[ "$(id -u)" -eq 0 ] || fail "run me as root: packages are installed and 32-bit programs registered with the kernel (binfmt_misc)"

installed() {
  dpkg-query -W -f='${Status}' "$1" 2>/dev/null | grep -q 'install ok installed'
}

packages="
  build-essential cmake ninja-build git python3 python3-pefile
  g++-multilib qemu-user qemu-user-static
  g++-mingw-w64-i686 g++-mingw-w64-x86-64 binutils-mingw-w64-i686 binutils-mingw-w64-x86-64
  wine64 wine
  libgtest-dev googletest libbenchmark-dev
  clang libclang-rt-14-dev
  fp-utils libchm-bin
"
missing=""
for p in $packages; do
  installed "$p" || missing="$missing $p"
done

# 32-bit Wine comes from the i386 architecture, which every apt source must offer: wine32's
# dependencies are spread over the main and the security archives.
if ! installed wine32:i386; then
  missing="$missing wine32:i386"
  dpkg --print-foreign-architectures | grep -qx i386 || dpkg --add-architecture i386
  for f in /etc/apt/sources.list.d/*.sources; do
    [ -f "$f" ] || continue
    awk '/^Types:/ && !seen { print; print "Architectures: amd64 i386"; next }
         /^Architectures:/ { next }
         { print }' "$f" >"$f.new" && mv "$f.new" "$f"
  done
  if [ -f /etc/apt/sources.list ]; then
    sed -i -E 's/^deb (\[[^]]*\] )?/deb /; s/^deb /deb [arch=amd64,i386] /' /etc/apt/sources.list
  fi
fi

if [ -n "$missing" ]; then
  apt-get update
  # shellcheck disable=SC2086
  DEBIAN_FRONTEND=noninteractive apt-get install -y --no-install-recommends $missing
fi

# The kernel runs only 64-bit programs here: binfmt_misc hands every i386 ELF program (32-bit
# Wine's loader among them) to qemu through our small static interpreter.
interpreter=/usr/local/libexec/qemu-i386-binfmt-P
source="$root/tools/qemu-i386-binfmt.c"
if [ ! -x "$interpreter" ] || [ "$source" -nt "$interpreter" ]; then
  mkdir -p "$(dirname "$interpreter")"
  gcc -O2 -static -Wall -Wextra -Werror -o "$interpreter" "$source" ||
    fail "cannot build the i386 interpreter from $source (gcc and libc6-dev are needed)"
fi
binfmt=/proc/sys/fs/binfmt_misc
if ! mountpoint -q "$binfmt"; then
  [ -d "$binfmt" ] || fail "this kernel has no binfmt_misc ($binfmt is missing): 32-bit programs cannot run; use a kernel with CONFIG_BINFMT_MISC or load its module (modprobe binfmt_misc) on the host"
  mount -t binfmt_misc binfmt_misc "$binfmt" 2>/dev/null ||
    fail "cannot mount binfmt_misc on $binfmt: run with the privilege to mount (a container needs --privileged, or mount it on the host first)"
fi
[ -w "$binfmt/register" ] || fail "$binfmt/register is not writable: 32-bit programs cannot be registered without that privilege"
entry=qemu-i386
[ -e "$binfmt/$entry" ] && echo -1 >"$binfmt/$entry"
magic='\x7fELF\x01\x01\x01\x00\x00\x00\x00\x00\x00\x00\x00\x00\x02\x00\x03\x00'
mask='\xff\xff\xff\xff\xff\xfe\xfe\x00\xff\xff\xff\xff\xff\xff\xff\xff\xfe\xff\xff\xff'
printf '%s' ":$entry:M::$magic:$mask:$interpreter:PF" >"$binfmt/register" 2>/dev/null ||
  fail "the kernel refused the binfmt_misc registration of $interpreter"
grep -qx enabled "$binfmt/$entry" || fail "the binfmt_misc entry $entry is not enabled"

# A 32-bit program must now run directly.
probe=$(mktemp -d)
trap 'rm -rf "$probe"' EXIT
printf 'int main(void) { return sizeof(void*) == 4 ? 0 : 1; }\n' >"$probe/p.c"
gcc -m32 -o "$probe/p" "$probe/p.c" || fail "gcc -m32 cannot build a 32-bit program (g++-multilib)"
"$probe/p" || fail "a 32-bit program does not run although $entry is registered"
echo "setup: all packages installed; 32-bit programs run through $interpreter"
