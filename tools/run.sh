#!/usr/bin/env bash
# Builds the console and opens it on the sample workstation: a Wine prefix of its own
# (build/workstation/prefix) with Mapora Desktop 10.5 and Engine 10.5 installed. The README's run
# command. Arguments go to the console, for example: tools/run.sh /Lang 1036
#
# 32-bit Wine is not available from our package mirror, so the console that runs here is the x64
# build; the i686 build (build/x86) is the shipped product and is built alongside.
set -euo pipefail
cd "$(dirname "$0")/.."
tools/install-deps.sh
# Before the long part: without a display nothing can be shown (xvfb-run is installed by now).
workstation/workstation.sh check-display
cmake --preset x86 >/dev/null
cmake --build --preset x86 -j "$(nproc)"
# Of the x64 tree only what the workstation takes; tools/test.sh builds the tests.
cmake --preset x64 >/dev/null
cmake --build --preset x64 -j "$(nproc)" --target workstation
workstation/workstation.sh provision build/x64
exec workstation/workstation.sh open "$@"
