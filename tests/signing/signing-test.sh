#!/usr/bin/env bash
# Signs copies of both trees' shipped files through the build's own scripts, in the order a signing
# build follows (programs and packs, the package built from them, the package), with a certificate
# authority made here and thrown away, and checks what Windows would check.
#
#   signing-test.sh SCRATCH_DIR VERSION BUILD_SIGNS(ON|OFF) X64_TREE X86_TREE
#
# The signed x64 package stays in SCRATCH_DIR for the installation under Wine.
set -uo pipefail
scratch=$1 version=$2 build_signs=$3
declare -A tree=([x64]=$4 [x86]=$5)
source_dir=$(cd "$(dirname "$0")/../.." && pwd)
source "$source_dir/tests/support/checks.sh"

rm -rf "$scratch" && mkdir -p "$scratch/bin" && cd "$scratch"
# The throwaway authority: a root, and a code-signing certificate it issued in a PKCS#12 file.
export password="throwaway-$RANDOM-$RANDOM"
{
  openssl req -x509 -newkey rsa:2048 -nodes -keyout root.key -out root.pem -days 2 -subj "/CN=Throwaway Root" \
    -addext "basicConstraints=critical,CA:true" -addext "keyUsage=critical,keyCertSign"
  openssl req -x509 -newkey rsa:2048 -nodes -keyout signer.key -out signer.pem -days 2 -CA root.pem -CAkey root.key \
    -subj "/CN=Throwaway Publisher/O=Test" -addext "basicConstraints=CA:false" \
    -addext "keyUsage=critical,digitalSignature" -addext "extendedKeyUsage=codeSigning"
  openssl pkcs12 -export -in signer.pem -inkey signer.key -passout env:password -out signer.p12
} >ca.log 2>&1 || { cat ca.log; echo "FAIL: could not make the throwaway authority"; exit 1; }
key=(MAPORA_SIGN_PKCS12=signer.p12 MAPORA_SIGN_PASSWORD="$password")

# osslsigncode and openssl through wrappers that log their command lines: what ps would show.
for tool in osslsigncode openssl; do
  printf '#!/bin/sh\necho "$0 $*" >>"%s/commands.log"\nexec %s "$@"\n' "$scratch" "$(command -v $tool)" >bin/$tool &&
    chmod +x bin/$tool
done
export PATH="$scratch/bin:$PATH"

# run NAME EXIT OUTPUT_REGEX [VAR=value...] -- FILE...: the signing script's exit code and output
# (standard output and error, kept in $out) against what is expected; the password never shows.
run() {
  local name=$1 want_rc=$2 want_out=$3 vars=() rc
  shift 3
  while [ "$1" != "--" ]; do vars+=("$1") && shift; done
  out=$(env -u MAPORA_SIGN_PKCS12 -u MAPORA_SIGN_PASSWORD -u MAPORA_SIGN_TIMESTAMP_URL "${vars[@]}" \
    "$source_dir/tools/sign.sh" "${@:2}" 2>&1)
  rc=$?
  if [ $rc -ne "$want_rc" ] || ! grep -Eq "$want_out" <<<"$out" || grep -qF "$password" <<<"$out"; then
    fail "$name"$'\n'"  got: exit $rc, output:"$'\n'"$out"$'\n'"  expected: exit $want_rc, output matching /$want_out/ without the password"
  fi
}

# verdict FILE: osslsigncode's verdict on FILE against the throwaway root, pass or its reasons.
verdict() { osslsigncode verify -CAfile root.pem -in "$1" >verify.log 2>&1 && echo pass || cat verify.log; }
# same A B: nothing, or how the two folder trees differ.
same() { diff -r "$1/x64" "$2/x64" && diff -r "$1/x86" "$2/x86"; }

# Copies of the files each tree's package is built from; un/ keeps them as they were built.
files=()
for arch in x64 x86; do
  cp -r "${tree[$arch]}/installer/staging" $arch || fail "the $arch tree's staged files: none, expected a folder"
  while read -r rel; do files+=("$arch/$rel"); done <"${tree[$arch]}/installer/staged-pe-files.txt"
done
mkdir un && cp -r x64 x86 un/
n=${#files[@]} one=${files[0]}

run "no certificate" 0 "nothing signed: $n files left unsigned" -- "${files[@]}"
run "wrong password" 1 "cannot open signer.p12 \(wrong password" MAPORA_SIGN_PKCS12=signer.p12 \
  MAPORA_SIGN_PASSWORD=wrong -- "$one"
check "files after signing without a certificate or its password" "" same un .

# No time-stamping server answers here: the files are signed all the same, and the report says so.
run "first signing" 0 \
  "^Signing: signed $n files \(0 already signed\) as \"CN = Throwaway Publisher, O = Test\", not timestamped$" \
  "${key[@]}" MAPORA_SIGN_TIMESTAMP_URL=http://127.0.0.1:9/ -- "${files[@]}"
check "first signing: a warning naming the unanswered time-stamping server" 1 \
  grep -c "warning: the time-stamping server http://127.0.0.1:9/ did not answer" <<<"$out"
for f in "${files[@]}"; do check "signed $f" pass verdict "$f"; done

# Nothing relinked: nothing signed again. One file relinked: that one alone.
mkdir before && cp -r x64 x86 before/
run "nothing changed" 0 "nothing to sign, $n files already signed" "${key[@]}" -- "${files[@]}"
check "files after signing with nothing changed" "" same before .
cp "un/$one" "$one"
run "one file relinked" 0 "signed 1 file \($((n - 1)) already signed\)" "${key[@]}" -- "${files[@]}"

# Each package built from the signed files, then signed: it and every program and pack inside.
for arch in x64 x86; do
  package=MaporaAdmin-$version-$arch.msi
  cmake -DSTAGING_DIR=$arch -DARCH=$arch -DVERSION="$version" -DOUTPUT="$package" \
    -P "$source_dir/installer/BuildPackage.cmake" >log 2>&1 || fail "the $arch package not built: $(cat log)"
  run "$arch package" 0 "signed 1 file \(0 already signed\)" "${key[@]}" -- "$package"
  check "$arch package" pass verdict "$package"
  msiextract -C "$arch-inside" "$package" >/dev/null 2>&1
  inside=$(find "$arch-inside" -name '*.exe' -o -name '*.dll')
  check "number of programs and packs in the $arch package: $inside" "$(wc -l <"${tree[$arch]}/installer/staged-pe-files.txt")" \
    wc -l <<<"$inside"
  for f in $inside; do check "$arch package, inside: $f" pass verdict "$f"; done
done

# The x64 tree's own staged files and package carry a signature exactly when it signs.
want=no && [ "$build_signs" = ON ] && want=yes
has_signature() { osslsigncode extract-signature -in "$1" -out sig >/dev/null 2>&1 && rm sig && echo yes || echo no; }
while read -r f; do
  check "the build's $f signed (the build signs: $build_signs)" $want has_signature "$f"
done < <(sed "s|^|${tree[x64]}/installer/staging/|" "${tree[x64]}/installer/staged-pe-files.txt"
  echo "${tree[x64]}/installer/MaporaAdmin-$version-x64.msi")

check "command lines with the password (what ps shows)" 0 grep -c -F "$password" commands.log
echo "$n files and 2 packages signed and checked, $failures failures"
[ $failures -eq 0 ]
