#!/usr/bin/env bash
# The start-up benchmark (README, "Performance"): times the console's start-up against a minimal
# dialog program with the same kinds of controls (bench/BenchDialog), and the opening of Advanced
# Configuration, on a workstation like the sample one with many language-pack folders. Not a
# test: nothing fails on a slow figure, and CI does not run it.
#
#   tools/bench.sh [--runs N] [--trace] [--close] [--folders N] [--baseline EXE]
#
#   --runs N        measured starts of each program, and openings of Advanced Configuration (15)
#   --trace         the programs write start-up traces (MAPORA_STARTUP_TRACE); prints where the time goes
#   --close         ends each program through Cancel instead of terminating it, and times that
#   --folders N     language-pack folders added to each product's bin folder (200, at most 200)
#   --baseline EXE  another x64 build of MaporaAdmin.exe, timed in turn with this one: a change
#                   measured against the program before it, under the same load
#
# Everything runs in one warm wineserver on a private Xvfb display, in the prefix build/bench/prefix,
# both of which it stops at the end. The last line of the output is "BENCH key=value ...".
set -euo pipefail
cd "$(dirname "$0")/.."
root=$(pwd)

runs=15
folders=200
baseline=
driver_options=()
while [ $# -gt 0 ]; do
  case "$1" in
    --runs) runs=${2:?--runs needs a number}; shift 2 ;;
    --folders) folders=${2:?--folders needs a number}; shift 2 ;;
    --trace) driver_options+=(--trace 'C:\bench\trace'); shift ;;
    --close) driver_options+=(--close); shift ;;
    --baseline) baseline=$(realpath "${2:?--baseline needs a program}"); shift 2 ;;
    *) echo "usage: $0 [--runs N] [--trace] [--close] [--folders N] [--baseline EXE]" >&2; exit 2 ;;
  esac
done
[[ "$runs" =~ ^[1-9][0-9]*$ && "$folders" =~ ^[0-9]+$ ]] || { echo "--runs and --folders take a number" >&2; exit 2; }
mapfile -t names < <(grep -v '^#' bench/language-folders.txt)
[ "$folders" -le "${#names[@]}" ] || { echo "--folders: at most ${#names[@]}" >&2; exit 2; }

tools/install-deps.sh
cmake --preset x64 >/dev/null
cmake --build --preset x64 -j "$(nproc)" --target bench

bench=$root/build/bench
mkdir -p "$bench"
export WINEPREFIX="$bench/prefix" WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml="
export MAPORA_WORKSTATION_PREFIX="$WINEPREFIX"
drive_c="$WINEPREFIX/drive_c"

xvfb_pid=
stop_session() {
  if [ -d "$WINEPREFIX" ]; then wineserver -k 2>/dev/null || true; wineserver -w 2>/dev/null || true; fi
  if [ -n "$xvfb_pid" ]; then kill "$xvfb_pid" 2>/dev/null || true; wait "$xvfb_pid" 2>/dev/null || true; fi
}
trap stop_session EXIT

# A display of our own; -displayfd picks a free number.
fifo=$(mktemp -u); mkfifo "$fifo"
Xvfb -displayfd 5 -screen 0 1280x1024x24 -nolisten tcp -noreset 5>"$fifo" >/dev/null 2>&1 &
xvfb_pid=$!
read -r -t 30 display_number < "$fifo" || { echo "Xvfb did not start" >&2; exit 1; }
rm -f "$fifo"
export DISPLAY=":$display_number"

mkdir -p "$WINEPREFIX"
wineserver -p </dev/null >/dev/null 2>&1
workstation/workstation.sh provision build/x64

# The language-pack folders of a big installation in Desktop's and Engine's bin folders: the first
# $folders names of the list are there, the others are not (a run with fewer removes them).
for product in Desktop10.5 Engine10.5; do
  bin="$drive_c/Program Files (x86)/Kvel/$product/bin"
  for i in "${!names[@]}"; do
    if [ "$i" -lt "$folders" ]; then
      mkdir -p "$bin/${names[$i]}"
      echo "language pack" > "$bin/${names[$i]}/pack.txt"
    else
      rm -rf "${bin:?}/${names[$i]}"
    fi
  done
done
echo "Language-pack folders added to each product's bin folder: $folders"

# The floor beside the console, so that both start from the same folder; the driver apart.
console='C:\Program Files (x86)\Common Files\Mapora\bin\MaporaAdmin.exe'
floor='C:\Program Files (x86)\Common Files\Mapora\bin\BenchDialog.exe'
cp -f build/x64/bench/BenchDialog.exe "$drive_c/Program Files (x86)/Common Files/Mapora/bin/"
if [ -n "$baseline" ]; then
  cp -f "$baseline" "$drive_c/Program Files (x86)/Common Files/Mapora/bin/MaporaAdminBaseline.exe"
  driver_options+=(--baseline 'C:\Program Files (x86)\Common Files\Mapora\bin\MaporaAdminBaseline.exe')
fi
mkdir -p "$drive_c/bench"
cp -f build/x64/bench/BenchDriver.exe "$drive_c/bench/"
rm -rf "$drive_c/bench/trace"

# Start the session over, so that the first window opens the virtual desktop that provisioning set.
wineserver -k; wineserver -w
wineserver -p </dev/null >/dev/null 2>&1
wine cmd /c exit </dev/null >/dev/null 2>&1

echo "Machine: $(nproc) cores, load average $(cut -d" " -f1-3 /proc/loadavg), $(wine --version), $(date -u +%Y-%m-%d)"
# The programs run in English, as the tests do; the driver passes the setting on to them.
LC_ALL=en_US.UTF-8 wine 'C:\bench\BenchDriver.exe' --console "$console" --floor "$floor" --runs "$runs" \
  "${driver_options[@]}" </dev/null 2>&1 | tee "$bench/last-run.txt"
