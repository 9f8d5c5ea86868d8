#!/usr/bin/env bash
# start BUILD_DIR: a fresh Wine prefix in BUILD_DIR/wineprefix, a private Xvfb display for it,
#   and a persistent wineserver so that every later program starts in milliseconds.
# stop BUILD_DIR: ends that wineserver (and everything running in the prefix) and the display.
set -euo pipefail
cmd=$1
build=$(cd "$2" && pwd)
export WINEPREFIX="$build/wineprefix" WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml="

stop() {
  if [ -d "$WINEPREFIX" ]; then wineserver -k 2>/dev/null || true; wineserver -w 2>/dev/null || true; fi
  if [ -r "$build/wine-xvfb.pid" ]; then
    kill "$(cat "$build/wine-xvfb.pid")" 2>/dev/null || true
    rm -f "$build/wine-xvfb.pid"
  fi
  rm -f "$build/wine-display"
}

case "$cmd" in
  start)
    stop
    rm -rf "$WINEPREFIX"
    # -displayfd picks a free display number, so parallel build trees never collide.
    fifo=$(mktemp -u); mkfifo "$fifo"
    Xvfb -displayfd 5 -screen 0 1280x1024x24 -nolisten tcp -noreset 5>"$fifo" >/dev/null 2>&1 &
    echo $! > "$build/wine-xvfb.pid"
    read -r -t 30 num < "$fifo" || { echo "Xvfb did not start" >&2; exit 1; }
    rm -f "$fifo"
    echo ":$num" > "$build/wine-display"
    export DISPLAY=":$num"
    # The server and the services that the first program starts live on after it; started
    # here with no output attached, they never hold a test's output open.
    mkdir -p "$WINEPREFIX"
    wineserver -p </dev/null >/dev/null 2>&1
    wineboot -i </dev/null >/dev/null 2>&1
    # Wine's own fonts (Tahoma, Marlett for the caption buttons, ...) are not put into new
    # prefixes by this Wine build; without them dialogs fall back to other faces.
    tools_dir=$(dirname "$0")
    "$tools_dir/wine-fonts.sh" "$WINEPREFIX"
    # A virtual desktop draws Windows' own window frames, so screenshots look like Windows.
    wine reg add 'HKCU\Software\Wine\Explorer' /v Desktop /d Default /f </dev/null >/dev/null 2>&1
    wine reg add 'HKCU\Software\Wine\Explorer\Desktops' /v Default /d 1024x768 /f </dev/null >/dev/null 2>&1
    # The desktop that wineboot opened predates those settings: start the session over so the
    # first window opens the virtual desktop.
    wineserver -k; wineserver -w
    wineserver -p </dev/null >/dev/null 2>&1
    wine cmd /c exit </dev/null >/dev/null 2>&1
    echo "Wine prefix ready: $WINEPREFIX on display :$num"
    ;;
  stop) stop ;;
  *) echo "usage: $0 start|stop BUILD_DIR" >&2; exit 2 ;;
esac
