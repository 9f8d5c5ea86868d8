#!/usr/bin/env bash
# Links Wine's own fonts into a prefix's Fonts folder (see wine-session.sh for why).
set -eu
prefix=$1
fonts="$prefix/drive_c/windows/Fonts"
mkdir -p "$fonts"
for f in /usr/share/wine/fonts/*; do
  [ -e "$fonts/$(basename "$f")" ] || ln -s "$f" "$fonts/"
done
