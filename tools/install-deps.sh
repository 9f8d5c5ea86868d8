#!/usr/bin/env bash
# Installs what building, running and testing need on Debian 12. As root it installs the
# missing packages with apt-get; as anyone else it names them and stops.
set -euo pipefail

packages=(
  cmake make
  g++-mingw-w64-i686-posix g++-mingw-w64-x86-64-posix
  binutils-mingw-w64-i686 binutils-mingw-w64-x86-64
  googletest
  # JSON of MaporaReport (header-only)
  nlohmann-json3-dev
  wine wine64 fonts-wine
  xvfb xauth x11-utils imagemagick
  fp-utils
  # The Windows Installer packages (wixl) and reading them back (msiinfo, msiextract)
  wixl msitools
  # Authenticode signing of what ships, and the signing tests' throwaway certificates
  osslsigncode openssl
  # Japanese and Chinese glyphs for the language packs under Wine (its own Tahoma has Arabic)
  fonts-vlgothic fonts-wqy-microhei
)

missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done
[ ${#missing[@]} -eq 0 ] && exit 0

if [ "$(id -u)" -ne 0 ]; then
  echo "Missing packages: ${missing[*]}" >&2
  echo "Install them (as root: apt-get install ${missing[*]}) and run again." >&2
  exit 1
fi
echo "Installing: ${missing[*]}"
export DEBIAN_FRONTEND=noninteractive
apt-get update -q
apt-get install -y -q --no-install-recommends "${missing[@]}" </dev/null
