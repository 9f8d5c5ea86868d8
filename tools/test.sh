#!/usr/bin/env bash
# Builds both targets and runs every test under Wine. The README's test command.
set -euo pipefail
cd "$(dirname "$0")/.."
tools/install-deps.sh
jobs=$(nproc)
cmake --preset x86 >/dev/null
cmake --build --preset x86 -j "$jobs"
cmake --preset x64 >/dev/null
cmake --build --preset x64 -j "$jobs"
ctest --preset x64
