#!/bin/sh
# capture-window.sh SOURCE GEOMETRY OUTPUT.png
# Photographs GEOMETRY (WxH+X+Y) of the X window SOURCE ("root" or an id) once the picture has
# stopped changing, so that a window that is still painting is not caught half drawn. OUTPUT
# appears only when complete. Started by the end-to-end test driver from inside Wine.
source=$1 geometry=$2 output=$3
previous=
for attempt in $(seq 1 50); do
  current="$output.$attempt.ppm"
  import -window "$source" -crop "$geometry" +repage "ppm:$current" || break
  if [ -n "$previous" ] && cmp -s "$previous" "$current"; then
    convert "$current" "$output.partial.png" && mv "$output.partial.png" "$output"
    break
  fi
  rm -f "$previous"
  previous=$current
  sleep 0.1
done
rm -f "$output".*.ppm
