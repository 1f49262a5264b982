#!/bin/sh
# Takes a picture of the root-key dialog as Wine's own user32 draws it, and saves it as
# docs/images/root-key-dialog.png. Not part of the tests.
#
# Needs the windows-x64 build (cmake --preset windows-x64 && cmake --build --preset
# windows-x64) and the packages xvfb, x11-apps (xwd), imagemagick and fonts-wine. It runs in a
# prefix of its own (build/screenshot-prefix) with Wine's X11 driver on a private Xvfb server,
# windows unmanaged (without a window manager, managed windows lose their caption), and Wine's
# fonts copied into the prefix so that "Tahoma" is found.
set -eu

root=$(cd "$(dirname "$0")/.." && pwd)
build="$root/build/windows-x64"
out="$root/docs/images/root-key-dialog.png"
if [ ! -f "$build/bin/hivelet-host.exe" ] || [ ! -f "$build/bin/Hivelet.hzx" ]; then
  echo "screenshot-dialog: build the windows-x64 preset first" >&2
  exit 2
fi
for tool in Xvfb xwd convert wine64; do
  if ! PATH=/usr/lib/wine:$PATH command -v "$tool" >/dev/null; then
    echo "screenshot-dialog: $tool is missing (apt-get install xvfb x11-apps imagemagick fonts-wine wine64)" >&2
    exit 2
  fi
done

export PATH=/usr/lib/wine:$PATH
export WINEPREFIX="$root/build/screenshot-prefix"
export WINEDEBUG=-all
export WINEDLLOVERRIDES="mscoree,mshtml="

work=$(mktemp -d)
xvfb_pid=
cleanup() {
  timeout 30 wineserver -k 2>/dev/null || true
  [ -n "$xvfb_pid" ] && kill "$xvfb_pid" 2>/dev/null || true
  rm -rf "$work"
}
trap cleanup EXIT

# A private X server on a black root, so that the picture can be cut to the dialog.
Xvfb -displayfd 3 -screen 0 800x600x24 -nolisten tcp -br 3>"$work/display" 2>/dev/null &
xvfb_pid=$!
for _ in $(seq 50); do [ -s "$work/display" ] && break; sleep 0.1; done
export DISPLAY=":$(cat "$work/display")"

if [ ! -f "$WINEPREFIX/.hivelet-screenshot-ready" ]; then
  mkdir -p "$WINEPREFIX"
  timeout 300 wine64 wineboot --init </dev/null >/dev/null 2>&1
  timeout 60 wine64 reg add 'HKCU\Software\Wine\X11 Driver' /v Managed /d N /f </dev/null >/dev/null 2>&1
  timeout 60 wineserver -w
  mkdir -p "$WINEPREFIX/drive_c/windows/Fonts"
  cp /usr/share/wine/fonts/*.ttf "$WINEPREFIX/drive_c/windows/Fonts/"
  touch "$WINEPREFIX/.hivelet-screenshot-ready"
fi

# The user selects HKEY_CURRENT_USER, waits while the picture is taken, then cancels.
cat >"$work/shot.hvs" <<'SCRIPT'
param record HKEY_LOCAL_MACHINE
param edit select 2 wait 6000 cancel
param expect result 0
SCRIPT
timeout 120 wine64 "$build/bin/hivelet-host.exe" run "$work/shot.hvs" </dev/null >"$work/run.log" 2>&1 &
host_pid=$!
# Wait for the dialog: the first look happens within a tick of its appearing.
sleep 4
xwd -root -silent -display "$DISPLAY" >"$work/screen.xwd"
wait "$host_pid" || { cat "$work/run.log" >&2; exit 1; }
mkdir -p "$(dirname "$out")"
convert "$work/screen.xwd" -trim +repage "$out"
echo "saved $out ($(identify -format '%wx%h' "$out"))"
