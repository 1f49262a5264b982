#!/bin/sh
# Sets up, builds and tests every build: linux (ASan+UBSan), linux-i386 (under qemu-i386),
# windows-i686 (the shipped DLL, its static checks, and the simulator and tests under 32-bit
# Wine), windows-x64 (under 64-bit Wine), release (the help file and the archive, their checks,
# and two more builds that must give the same bytes) and fuzz (a short run of every fuzz
# target). Ends with the totals over all builds and the time each build's tests took.
set -eu
cd "$(dirname "$0")/.."
tools/setup.sh
presets=${HV_PRESETS:-"linux linux-i386 windows-i686 windows-x64 release fuzz"}
stopWine() {
  for p in windows-i686 windows-x64 release; do
    PATH=/usr/lib/wine:$PATH WINEPREFIX="$PWD/build/$p/wine-prefix" wineserver -k 2>/dev/null || true
  done
}
trap stopWine EXIT
mkdir -p build
summary=build/test-summary.txt
: >"$summary"
status=0
for p in $presets; do
  echo "=== $p"
  cmake --preset "$p" >/dev/null
  cmake --build --preset "$p"
  log="build/ctest-$p.log"
  # Under Wine a test has been seen to fail once in a dozen full runs and pass on every rerun;
  # a second try there keeps CI from turning on it while the cause is looked for.
  retry=""
  case $p in windows-*) retry="--repeat until-pass:2" ;; esac
  start=$(date +%s)
  # shellcheck disable=SC2086
  if ctest --preset "$p" -j2 $retry >"$log" 2>&1; then
    grep -E 'tests passed' "$log" || true
  else
    status=1
    grep -B2 -A30 -E 'Failure|\*\*\*Failed|\*\*\*Timeout|Errors while' "$log" | tail -150 || true
  fi
  seconds=$(($(date +%s) - start))
  echo "$p: tests took $seconds s"
  sed -n 's/.*tests passed, \([0-9]*\) tests\{0,1\} failed out of \([0-9]*\).*/\1 \2/p' "$log" |
    sed "s/\$/ $seconds/; s/^/$p /" >>"$summary"
done
[ "$status" -eq 0 ] || { echo "Some tests failed; the logs are build/ctest-<preset>.log"; }
awk '{ failed += $2; total += $3; printf "%-14s %5d tests, %d failed, %4d s\n", $1, $3, $2, $4 }
     END { printf "ctest: %d passed, %d failed\n", total - failed, failed }' "$summary"
exit $status
