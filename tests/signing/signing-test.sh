#!/usr/bin/env bash
# Signs copies of a build's shipped files through the build's own signing script, with a
# certificate authority made here and thrown away, and checks what Windows would check.
#
#   signing-test.sh programs SCRATCH_DIR BUILD_SIGNS(ON|OFF) X64_TREE X64_FILES... -- X86_TREE
#       the programs and packs of both trees
#   signing-test.sh packages SCRATCH_DIR VERSION X64_TREE X86_TREE
#       both packages as a signing build makes them: programs and packs signed, then packaged, then
#       the package signed; the x64 one stays in SCRATCH_DIR for the installation under Wine
set -uo pipefail
mode=$1 scratch=$2
shift 2
source_dir=$(cd "$(dirname "$0")/../.." && pwd)
sign=$source_dir/tools/sign.sh

failures=0
fail() { # what, expected, got
  echo "FAIL: $1"; echo "  expected: $2"; echo "  got: $3"; failures=$((failures + 1))
}

rm -rf "$scratch" && mkdir -p "$scratch/ca" "$scratch/bin"
cd "$scratch"

# The throwaway authority: a root and a code-signing certificate it issued, in a PKCS#12 file.
export password="throwaway-$RANDOM-$RANDOM"
(
  cd ca
  openssl req -x509 -newkey rsa:2048 -nodes -keyout root.key -out root.pem -days 2 -subj "/CN=Throwaway Root" \
    -addext "basicConstraints=critical,CA:true" -addext "keyUsage=critical,keyCertSign"
  openssl req -newkey rsa:2048 -nodes -keyout signer.key -out signer.csr -subj "/CN=Throwaway Publisher/O=Test"
  printf 'basicConstraints=CA:false\nkeyUsage=critical,digitalSignature\nextendedKeyUsage=codeSigning\n' >signer.ext
  openssl x509 -req -in signer.csr -CA root.pem -CAkey root.key -CAcreateserial -days 2 -extfile signer.ext \
    -out signer.pem
  openssl pkcs12 -export -in signer.pem -inkey signer.key -passout env:password -out signer.p12
) >ca.log 2>&1 || { cat ca.log; echo "FAIL: could not make the throwaway authority"; exit 1; }
key=(MAPORA_SIGN_PKCS12=ca/signer.p12 MAPORA_SIGN_PASSWORD="$password")

# osslsigncode and openssl through wrappers that log their command lines: what ps would show.
for tool in osslsigncode openssl; do
  printf '#!/bin/sh\necho "%s $*" >>"%s/commands.log"\nexec "%s" "$@"\n' $tool "$scratch" "$(command -v $tool)" \
    >bin/$tool
  chmod +x bin/$tool
done
export PATH="$scratch/bin:$PATH"

# run NAME EXIT OUTPUT_REGEX [VAR=value...] -- FILE...: the signing script's exit code and output
# (standard output and error, kept in $out) against what is expected.
run() {
  local name=$1 want_rc=$2 want_out=$3 vars=() rc
  shift 3
  while [ "$1" != "--" ]; do vars+=("$1"); shift; done
  shift
  out=$(env -u MAPORA_SIGN_PKCS12 -u MAPORA_SIGN_PASSWORD -u MAPORA_SIGN_TIMESTAMP_URL "${vars[@]}" "$sign" "$@" 2>&1)
  rc=$?
  if [ $rc -ne "$want_rc" ] || ! grep -Eq "$want_out" <<<"$out"; then
    fail "$name" "exit $want_rc, output matching /$want_out/" "exit $rc, output:"$'\n'"$out"
  fi
  if grep -qF "$password" <<<"$out"; then fail "$name: the password stays out of the log" "no password" "$out"; fi
}

# verify NAME FILE pass|fail: osslsigncode's verdict on FILE against the throwaway root.
verify() {
  local log verdict=pass
  log=$(osslsigncode verify -CAfile ca/root.pem -in "$2" 2>&1) || verdict=fail
  [ $verdict = "$3" ] || fail "$1: $2" "verification: $3" "verification: $verdict, osslsigncode said:"$'\n'"$log"
}

# same NAME FILE: FILE has the bytes of its unsigned original.
same() { cmp -s "$2" "un$2" || fail "$1: $2" "the bytes of un$2" "$(cmp "$2" "un$2" 2>&1)"; }

programs() {
  local build_signs=$1 x64_tree=$2 built=() files=() f rel
  shift 2
  while [ "$1" != "--" ]; do built+=("$1"); shift; done
  local x86_tree=$2
  built+=("$x86_tree"/app/MaporaAdmin.exe "$x86_tree"/report/MaporaReport.exe "$x86_tree"/packs/*/ResMaporaAdmin.dll)

  # Copies of the build's files under signed/, the originals under unsigned/, both by architecture.
  for f in "${built[@]}"; do
    [ -f "$f" ] || { fail "a shipped file of the build" "$f" "no such file"; continue; }
    case "$f" in "$x64_tree"/*) rel=x64/${f#"$x64_tree"/} ;; *) rel=x86/${f#"$x86_tree"/} ;; esac
    mkdir -p "$(dirname "unsigned/$rel")" "$(dirname "signed/$rel")"
    cp "$f" "unsigned/$rel" && cp "$f" "signed/$rel"
    files+=("signed/$rel")
  done
  local n=${#files[@]} one=${files[0]}

  run "no certificate" 0 "nothing signed: $n files left unsigned" -- "${files[@]}"
  for f in "${files[@]}"; do same "no certificate" "$f"; done

  run "wrong password" 1 "cannot open ca/signer.p12 \(wrong password" MAPORA_SIGN_PKCS12=ca/signer.p12 \
    MAPORA_SIGN_PASSWORD=wrong -- "$one"
  same "wrong password" "$one"

  # No time-stamping server answers here: the files are signed all the same, and the report says so.
  run "first signing" 0 \
    "^Signing: signed $n files \(0 already signed\) as \"CN = Throwaway Publisher, O = Test\", not timestamped$" \
    "${key[@]}" MAPORA_SIGN_TIMESTAMP_URL=http://127.0.0.1:9/ -- "${files[@]}"
  grep -q "warning: the time-stamping server http://127.0.0.1:9/ did not answer" <<<"$out" ||
    fail "first signing: the unanswered time-stamping server" "a warning naming it" "$out"
  for f in "${files[@]}"; do verify "signed" "$f" pass; done

  # Nothing relinked: nothing signed again. One file relinked: that one alone.
  cp -r signed before
  run "nothing changed" 0 "nothing to sign, $n files already signed" "${key[@]}" -- "${files[@]}"
  for f in "${files[@]}"; do
    cmp -s "$f" "before/${f#signed/}" || fail "nothing changed: $f" "left as it was" "$(cmp "$f" "before/${f#signed/}")"
  done
  cp "un$one" "$one"
  run "one file relinked" 0 "signed 1 file \($((n - 1)) already signed\)" "${key[@]}" -- "${files[@]}"
  verify "relinked and signed again" "$one" pass

  # One byte changed halfway into the program, where the signature covers it.
  local offset byte
  for f in "${files[@]}"; do
    cp "$f" "$f.tampered"
    offset=$(($(stat -c %s "un$f") / 2))
    byte=$(od -An -tu1 -j $offset -N1 "$f" | tr -d ' ')
    printf "\\$(printf %03o $(((byte + 1) % 256)))" | dd of="$f.tampered" bs=1 seek=$offset conv=notrunc status=none
    verify "one byte changed at $offset" "$f.tampered" fail
  done

  # The build's own files carry a signature exactly when the build was given a certificate.
  local want=no has
  [ "$build_signs" = ON ] && want=yes
  for f in "${built[@]}"; do
    has=no
    osslsigncode extract-signature -in "$f" -out extracted.sig >extract.log 2>&1 && has=yes
    rm -f extracted.sig
    [ $has = $want ] || fail "$f carries a signature" "$want (the build signs: $build_signs)" "$has: $(cat extract.log)"
  done
}

packages() {
  local version=$1 arch tree pe rel package f inside
  shift
  for arch in x64 x86; do
    tree=$1 && shift
    [ -d "$tree/installer/staging" ] || { fail "$arch package" "$tree/installer/staging" "no staging folder"; continue; }
    cp -r "$tree/installer/staging" "$arch"
    pe=()
    while read -r rel; do pe+=("$arch/$rel"); done <"$tree/installer/staged-pe-files.txt"
    package=MaporaAdmin-$version-$arch.msi
    run "$arch programs and packs" 0 "signed ${#pe[@]} files" "${key[@]}" -- "${pe[@]}"
    cmake -DSTAGING_DIR="$arch" -DARCH=$arch -DVERSION="$version" -DOUTPUT="$package" \
      -P "$source_dir/installer/BuildPackage.cmake" >"$arch.log" 2>&1 ||
      fail "$arch package built from the signed files" "a package" "$(cat "$arch.log")"
    run "$arch package" 0 "signed 1 file \(0 already signed\)" "${key[@]}" -- "$package"
    verify "$arch package" "$package" pass

    # What the package installs: every program and pack, each signed.
    msiextract -C "$arch-inside" "$package" >/dev/null 2>&1
    inside=$(find "$arch-inside" -name '*.exe' -o -name '*.dll' | sort)
    [ "$(wc -l <<<"$inside")" -eq ${#pe[@]} ] ||
      fail "$arch package: programs and packs inside" "${#pe[@]}: ${pe[*]}" "$inside"
    for f in $inside; do verify "$arch package, inside" "$f" pass; done
  done
}

"$mode" "$@"

grep -F -m 3 "$password" commands.log && fail "command lines (what ps shows)" "no password" "the lines above"
echo "$mode: $failures failures"
[ $failures -eq 0 ]
