#!/bin/sh
# capture-window.sh OUTPUT.png SOURCE LEFT TOP RIGHT BOTTOM: photographs that part of X window SOURCE
# (0: the root window) once two shots agree, not half painted. OUTPUT appears only when complete.
source=$2; [ "$source" = 0 ] && source=root
mkdir -p "$(dirname "$1")"
for shot in $(seq 1 50); do
  import -window "$source" -crop "$(($5 - $3))x$(($6 - $4))+$3+$4" +repage "ppm:$1.$shot.ppm" || break
  if cmp -s "$1.$((shot - 1)).ppm" "$1.$shot.ppm"; then convert "$1.$shot.ppm" "$1.png" && mv "$1.png" "$1"; break; fi
  sleep 0.1
done
rm -f "$1".*.ppm
