#!/bin/sh
# Takes a picture of one page of the help file, as the help viewer shows an event's page, and
# saves it as docs/images/help-page.png. Not part of the tests.
#
# Needs the release build (cmake --workflow --preset release), whose help pages it renders
# (build/release/help/pages, the sources of Help/Hivelet.chm), and the packages chromium and
# fonts-dejavu-core. Chromium runs headless, with a fresh profile, no network and no GPU.
# Usage: tools/screenshot-help.sh [PAGE.html]   (default: ActSetString.html)
set -eu

root=$(cd "$(dirname "$0")/.." && pwd)
page="$root/build/release/help/pages/${1:-ActSetString.html}"
out="$root/docs/images/help-page.png"
if [ ! -f "$page" ]; then
  echo "screenshot-help: $page is missing: build the release first (cmake --workflow --preset release)" >&2
  exit 2
fi
if ! command -v chromium >/dev/null; then
  echo "screenshot-help: chromium is missing (apt-get install chromium fonts-dejavu-core)" >&2
  exit 2
fi

profile=$(mktemp -d)
trap 'rm -rf "$profile"' EXIT
mkdir -p "$(dirname "$out")"
# The help viewer's topic pane is about this wide; the height fits the whole page.
timeout 120 chromium --headless --no-sandbox --disable-gpu --disable-background-networking \
  --no-first-run --disable-component-update --disable-sync --hide-scrollbars \
  --user-data-dir="$profile" --window-size=720,800 --screenshot="$out" \
  "file://$page" >/dev/null 2>&1
echo "saved $out"
