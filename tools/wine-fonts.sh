#!/usr/bin/env bash
# Fonts for a Wine prefix (WINEPREFIX, with its server running): this Wine build does not put its
# own fonts (Tahoma, Marlett for the caption buttons, ...) into new prefixes, and it has none of
# the faces the Japanese and Chinese dialogs ask for nor CJK glyphs behind the bold caption font;
# those are mapped to the CJK fonts that install-deps.sh installs.
set -eu
prefix=$1
fonts="$prefix/drive_c/windows/Fonts"
mkdir -p "$fonts"
for f in /usr/share/wine/fonts/*; do
  [ -e "$fonts/$(basename "$f")" ] || ln -s "$f" "$fonts/"
done

reg() { WINEPREFIX="$prefix" wine reg add "$@" /f </dev/null >/dev/null 2>&1; }
replacements='HKCU\Software\Wine\Fonts\Replacements'
reg "$replacements" /v 'Meiryo UI' /d 'VL PGothic'
reg "$replacements" /v SimSun /d 'WenQuanYi Micro Hei'
reg 'HKLM\Software\Microsoft\Windows NT\CurrentVersion\FontLink\SystemLink' /v 'Tahoma Bold' /t REG_MULTI_SZ \
  /d 'wqy-microhei.ttc,WenQuanYi Micro Hei'
