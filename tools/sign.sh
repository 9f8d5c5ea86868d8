#!/usr/bin/env bash
# Signs files in place with an Authenticode signature: PE files and Windows Installer packages
# alike. The build calls it (cmake/signing.cmake), and so do the signing tests.
#
#   sign.sh [--pkcs12 FILE] [--timestamp URL] [--description TEXT] FILE...
#
# The certificate and its key come from a PKCS#12 file (--pkcs12, else MAPORA_SIGN_PKCS12); its
# password only from the environment (MAPORA_SIGN_PASSWORD), so that it never appears on a command
# line that make echoes or that ps shows: it reaches osslsigncode on a pipe and openssl by the
# variable's name. With a time-stamping server (--timestamp, else MAPORA_SIGN_TIMESTAMP_URL) the
# signatures are timestamped; a server that does not answer costs the timestamp, never the build.
#
# A file that already carries a signature by the same certificate is left as it is, so an
# incremental build signs only what it relinked. Last line: the signing report.
set -euo pipefail

pkcs12=${MAPORA_SIGN_PKCS12:-}
timestamp_url=${MAPORA_SIGN_TIMESTAMP_URL:-}
description=""
while [ $# -gt 0 ]; do
  case "$1" in
    --pkcs12) pkcs12=$2; shift 2 ;;
    --timestamp) timestamp_url=$2; shift 2 ;;
    --description) description=$2; shift 2 ;;
    --) shift; break ;;
    -*) echo "sign.sh: unknown option $1" >&2; exit 2 ;;
    *) break ;;
  esac
done
files=("$@")

files_count() { if [ "$1" -eq 1 ]; then echo "1 file"; else echo "$1 files"; fi; }

if [ -z "$pkcs12" ]; then
  echo "Signing: no certificate (MAPORA_SIGN_PKCS12 is not set), nothing signed: $(files_count ${#files[@]}) left unsigned"
  exit 0
fi
if [ ! -r "$pkcs12" ]; then
  echo "sign.sh: cannot read the certificate file $pkcs12" >&2
  exit 1
fi
for f in "${files[@]}"; do
  [ -f "$f" ] || { echo "sign.sh: no file to sign at $f" >&2; exit 1; }
done

# An unset password is an empty one; openssl reads it through the variable's name.
export MAPORA_SIGN_PASSWORD=${MAPORA_SIGN_PASSWORD-}

# The signing certificate (the key's own, not the chain's): its serial tells our signatures from
# others', its subject goes into the report. Older PKCS#12 files need OpenSSL's legacy algorithms.
certificate() {
  local legacy
  for legacy in "" -legacy; do
    openssl pkcs12 $legacy -in "$pkcs12" -nokeys -clcerts -passin env:MAPORA_SIGN_PASSWORD 2>/dev/null \
      | openssl x509 -noout "$@" 2>/dev/null && return 0
  done
  echo "sign.sh: cannot open $pkcs12 (wrong password in MAPORA_SIGN_PASSWORD?)" >&2
  return 1
}
serial=$(certificate -serial) || exit 1
serial=${serial#serial=}
subject=$(certificate -subject) || exit 1
subject=${subject#subject=}

# The serial of the certificate that signed FILE, empty for an unsigned file.
signer_serial() {
  osslsigncode verify -in "$1" 2>/dev/null | sed -n 's/^[[:space:]]*Serial : //p' | head -n 1 || true
}

# osslsigncode never writes over a file: it signs into a new one beside the original, which then
# replaces it in one rename, so that nothing ever reads a half-written program.
sign_one() {
  local in=$1 out=$1.signing ts=$2 log
  local args=(sign -pkcs12 "$pkcs12" -readpass - -h sha256) bound=()
  [ -n "$description" ] && args+=(-n "$description")
  # A server that takes the connection and never answers is given up on like one that refuses it.
  [ -n "$ts" ] && args+=(-ts "$ts") && bound=(timeout 30)
  rm -f "$out"
  if log=$(printf '%s' "$MAPORA_SIGN_PASSWORD" | "${bound[@]}" osslsigncode "${args[@]}" -in "$in" -out "$out" 2>&1); then
    chmod --reference="$in" "$out" && mv -f "$out" "$in"
    return 0
  fi
  rm -f "$out"
  printf '%s\n' "$log" >&2
  return 1
}

signed=0
kept=0
for f in "${files[@]}"; do
  if [ "$(signer_serial "$f")" = "$serial" ]; then
    kept=$((kept + 1))
    continue
  fi
  if [ -n "$timestamp_url" ] && sign_one "$f" "$timestamp_url" 2>/dev/null; then
    signed=$((signed + 1))
    continue
  fi
  if [ -n "$timestamp_url" ]; then
    echo "sign.sh: warning: the time-stamping server $timestamp_url did not answer; signing without timestamps" >&2
    timestamp_url=""
  fi
  sign_one "$f" "" || { echo "sign.sh: could not sign $f" >&2; exit 1; }
  signed=$((signed + 1))
done

if [ $signed -eq 0 ]; then
  echo "Signing: nothing to sign, $(files_count $kept) already signed as \"$subject\""
elif [ -n "$timestamp_url" ]; then
  echo "Signing: signed $(files_count $signed) ($kept already signed) as \"$subject\", timestamped by $timestamp_url"
else
  echo "Signing: signed $(files_count $signed) ($kept already signed) as \"$subject\", not timestamped"
fi
