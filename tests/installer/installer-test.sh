#!/usr/bin/env bash
# The x64 package under Wine, each scenario in a Wine prefix of its own, created afresh:
#
#   installer-test.sh lifecycle BUILD_DIR   install, what it put in place, the console and the
#                                           report, the optional feature, repair, uninstall
#   installer-test.sh upgrade BUILD_DIR     two languages chosen, major upgrade, downgrade refused
#
# BUILD_DIR is the x64 tree; its Xvfb display (fixture "wine") shows the console. A third argument
# names another x64 package to take instead of the tree's own (the signing tests' signed one), tried
# in a folder beside it. Every failed check prints what it found and what it expected; the exit
# code is the number of failures.
set -uo pipefail
scenario=$1
build=$(cd "$2" && pwd)
package=${3:-}
source_dir=$(cd "$(dirname "$0")/../.." && pwd)
work="$build/installer-tests/$scenario"
[ -n "$package" ] && work="$(cd "$(dirname "$package")" && pwd)/installer-$scenario"
# No menu builder: it would put the shortcut's menu entries into this machine's own desktop.
export WINEPREFIX="$work/prefix" WINEARCH=win64 WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml=;winemenubuilder.exe=d"
DISPLAY=$(cat "$build/wine-display") && export DISPLAY

failures=0
fail() { echo "FAILED: $*" >&2; failures=$((failures + 1)); }
# expect WHAT GOT EXPECTED
expect() { [ "$2" = "$3" ] || fail "$1: got '$2', expected '$3'"; }
# expect_file WHAT 'C:\path' yes|no
expect_file() {
  local found=no
  [ -e "$(unix_path "$2")" ] && found=yes
  [ "$found" = "$3" ] || fail "$1: $2 exists: $found, expected $3"
}

unix_path() { local p=${1#[Cc]:}; echo "$WINEPREFIX/drive_c${p//\\//}"; }
windows_path() { echo "Z:$(realpath -m "$1" | tr / '\\')"; }

# msiexec ARGS...: runs it quietly with a verbose log (next to the prefix), sets $code and $log.
# Wine passes the exit code on modulo 256: 1603 arrives as 67, 1638 as 102.
run=0
msiexec() {
  run=$((run + 1))
  log="$work/msiexec-$run.log"
  wine msiexec "$@" /qn /l*v "$(windows_path "$log")" </dev/null >/dev/null 2>&1
  code=$?
}
# The last run must have succeeded.
expect_done() { [ "$code" -eq 0 ] || fail "msiexec $1 exited with $code, expected 0 (log: $log)"; }

# A value of the registry as `reg query` shows it, or nothing.
reg_value() {
  wine reg query "$1" /v "$2" </dev/null 2>/dev/null | tr -d '\r' |
    awk -v name="$2" '{ line = $0; sub(/^ +/, "", line) } index(line, name " ") == 1 {
      sub(/^[^ ]+( [^ ]+)* +REG_[A-Z_]+ +/, "", line); print line }'
}

property() { msiinfo export "$1" Property | tr -d '\r' | awk -F'\t' -v name="$2" '$1 == name { print $2 }'; }

version=$(sed -n 's/^project(MaporaAdmin VERSION \([0-9.]*\).*/\1/p' "$source_dir/CMakeLists.txt")
[ -n "$package" ] || package="$build/installer/MaporaAdmin-$version-x64.msi"
[ -f "$package" ] || { echo "FAILED: $package has not been built" >&2; exit 1; }
product_code=$(property "$package" ProductCode)
uninstall_key="HKLM\\SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\$product_code"
bin='C:\Program Files (x86)\Common Files\Mapora\bin'
suite='C:\Program Files\Common Files\Mapora'
packs=(fr de es ja zh-CN ar)

rm -rf "$work" && mkdir -p "$work"
wineboot -i </dev/null >/dev/null 2>&1 || { echo "FAILED: wineboot could not create $WINEPREFIX" >&2; exit 1; }

# The registry and the file tree as a sorted listing. Left out, as Wine itself changes them
# whatever the package does: the temporary folders; Wine's per-run state (the time zone,
# device, display, service and session keys under System, the volatile HARDWARE tree, the
# network cards it lists at each session start, the font and input caches and the session's
# mouse parameters under Software\Wine); the last-write timestamps.
snapshot() {
  local hive
  for hive in HKLM HKCU; do
    wine reg export "$hive" "$(windows_path "$work/$hive.reg")" /y </dev/null >/dev/null 2>&1
    iconv -f UTF-16 -t UTF-8 "$work/$hive.reg" | tr -d '\r' | grep -v '^#time=' |
      awk '/^\[/ { key = $0 } !/^\[/ && NF { print key " " $0 } /^\[/ { print }'
  done | grep -v -E '^\[HKEY_LOCAL_MACHINE\\(HARDWARE|System\\CurrentControlSet\\(Control\\(Session Manager|TimeZoneInformation|DeviceClasses|ServiceCurrent|Class|Video)|Enum|Services\\EventLog)|Software\\(Wow6432Node\\)?Microsoft\\Windows NT\\CurrentVersion\\NetworkCards)' |
    grep -v -E '^\[HKEY_CURRENT_USER\\(Volatile Environment|Software\\Wine\\(Fonts|MSIMM|Temporary System Parameters))'
  (cd "$WINEPREFIX/drive_c" && find . | grep -v -E '^\./(windows/temp|users/[^/]+/Temp|windows/logs)(/|$)' | sort)
}

lifecycle() {
  snapshot > "$work/before.txt"
  msiexec /i "$(windows_path "$package")"
  expect_done "/i"

  # What the install put in place.
  local tag lnk
  expect_file "console" "$bin\\MaporaAdmin.exe" yes
  expect_file "report" "$bin\\MaporaReport.exe" yes
  for tag in "${packs[@]}"; do expect_file "$tag pack" "$suite\\bin\\$tag\\ResMaporaAdmin.dll" yes; done
  expect_file "policy templates (off by default)" 'C:\windows\PolicyDefinitions\Mapora.admx' no
  # Wine keeps the per-user Start menu for per-machine packages; the log says which it took.
  lnk=$(sed -n 's/^Property(S): ProgramMenuFolder = \(.*\)\\$/\1/p' "$log" | tr -d '\r')
  expect_file "Start-menu shortcut" "$lnk\\Mapora Administrator.lnk" yes
  expect "Add/Remove Programs DisplayName" "$(reg_value "$uninstall_key" DisplayName)" "Mapora Administrator"
  expect "Add/Remove Programs Publisher" "$(reg_value "$uninstall_key" Publisher)" "Kvel"
  expect "Add/Remove Programs DisplayVersion" "$(reg_value "$uninstall_key" DisplayVersion)" "$version"
  expect "Add/Remove Programs HelpLink" "$(reg_value "$uninstall_key" HelpLink)" "https://support.kvel.example"
  # Add/Remove Programs shows the icon that the product's registration names.
  local icon
  icon=$(wine reg query 'HKLM\Software\Classes\Installer\Products' /s /v ProductIcon </dev/null 2>/dev/null |
    tr -d '\r' | sed -n 's/^ *ProductIcon *REG_SZ *//p')
  expect "product icon's file name" "${icon##*\\}" "MaporaAdmin.ico"
  [ -n "$icon" ] && expect_file "product icon" "$icon" yes

  # The installed programs run: the report prints its JSON, the console shows its window.
  local json
  json=$(wine "$bin\\MaporaReport.exe" --json </dev/null 2>/dev/null | head -c 1)
  expect "installed MaporaReport --json, first character" "$json" "{"
  wine "$bin\\MaporaAdmin.exe" </dev/null >/dev/null 2>&1 &
  local console=$!
  local shown=no
  for _ in $(seq 1 60); do
    xwininfo -root -tree 2>/dev/null | grep -q '"Mapora Administrator"' && { shown=yes; break; }
    sleep 0.5
  done
  expect "installed console's window shown" "$shown" yes
  wine taskkill /f /im MaporaAdmin.exe </dev/null >/dev/null 2>&1
  for _ in $(seq 1 20); do kill -0 "$console" 2>/dev/null || break; sleep 0.5; done
  if kill -0 "$console" 2>/dev/null; then
    fail "installed console: still running 10 s after taskkill, expected it ended"
    wineserver -k 2>/dev/null
  fi
  wait

  # The optional feature on request, in maintenance mode.
  msiexec /i "$(windows_path "$package")" ADDLOCAL=PolicyTemplates
  expect_done "ADDLOCAL=PolicyTemplates"
  expect_file "ADMX" 'C:\windows\PolicyDefinitions\Mapora.admx' yes
  expect_file "Japanese ADML" 'C:\windows\PolicyDefinitions\ja-JP\Mapora.adml' yes

  # Repair brings a deleted program back. Wine's msiexec does not implement /f, so the repair
  # is asked for by the properties /fa stands for.
  rm -f "$(unix_path "$bin\\MaporaAdmin.exe")"
  msiexec /i "$(windows_path "$package")" REINSTALL=ALL REINSTALLMODE=a
  expect_done "REINSTALL=ALL REINSTALLMODE=a (/fa)"
  expect_file "console after repair" "$bin\\MaporaAdmin.exe" yes

  # What users and policies write belongs to the suite and stays; everything else goes.
  local kept=(
    'HKCU\Software\KVEL|UILANGID|1036'
    'HKLM\SOFTWARE\KVEL\Desktop10.5\Settings|EnableKUEI|1'
    'HKCU\Software\KVEL\Mapora Connection\Settings|Support Local Portal|1'
    'HKLM\SOFTWARE\KVEL\Mapora Connection\Settings|Portal Server Set By Admin|1')
  local entry key name value
  for entry in "${kept[@]}"; do
    IFS='|' read -r key name value <<<"$entry"
    wine reg add "$key" /v "$name" /t REG_DWORD /d "$value" /f </dev/null >/dev/null 2>&1
  done
  msiexec /x "$(windows_path "$package")"
  expect_done "/x"
  for entry in "${kept[@]}"; do
    IFS='|' read -r key name value <<<"$entry"
    expect "$key\\$name after uninstall" "$(reg_value "$key" "$name")" "$(printf '0x%x' "$value")"
  done
  snapshot > "$work/after.txt"
  # Apart from the kept values and the keys that hold them, nothing differs. Wine leaves the
  # installer's own registration keys, empty, and its cache folder, which Windows always has.
  local diffs
  diffs=$(diff "$work/before.txt" "$work/after.txt" | grep '^[<>]' |
    grep -v -E '^> \[HKEY_LOCAL_MACHINE\\Software\\(Classes\\Installer|Microsoft\\Windows\\CurrentVersion\\Installer)(\\[^]]*)?\]$' |
    grep -v -x -F '> ./windows/Installer' |
    grep -v -i -E '^> \[HKEY_(LOCAL_MACHINE\\Software|CURRENT_USER\\Software)\\KVEL(\\Desktop10\.5(\\Settings)?|\\Mapora Connection(\\Settings)?)?\]$' |
    grep -v -E '"(UILANGID|EnableKUEI|Support Local Portal|Portal Server Set By Admin)"=dword')
  expect "registry and files after uninstall, against before install" "$diffs" ""
}

upgrade() {
  # A package of the same files with a lower version, built here as the build builds its own.
  local older_version older
  older_version="${version%.*}.$((${version##*.} - 1))"
  older="$work/MaporaAdmin-$older_version-x64.msi"
  cmake -DSTAGING_DIR="$build/installer/staging" -DARCH=x64 -DVERSION="$older_version" -DOUTPUT="$older" \
    -P "$source_dir/installer/BuildPackage.cmake" >/dev/null || fail "building $older"
  expect "UpgradeCode of the older package" "$(property "$older" UpgradeCode)" "$(property "$package" UpgradeCode)"
  [ "$(property "$older" ProductCode)" != "$product_code" ] || fail "ProductCode: both versions have $product_code"
  expect "component GUIDs of both versions" "$(msiinfo export "$older" Component)" "$(msiinfo export "$package" Component)"

  msiexec /i "$(windows_path "$older")" ADDLOCAL=Console,Lang_fr,Lang_de
  expect_done "/i older ADDLOCAL=Console,Lang_fr,Lang_de"
  local tag want
  for tag in "${packs[@]}"; do
    want=no
    case $tag in fr | de) want=yes ;; esac
    expect_file "$tag pack with ADDLOCAL=Console,Lang_fr,Lang_de" "$suite\\bin\\$tag\\ResMaporaAdmin.dll" "$want"
  done

  msiexec /i "$(windows_path "$package")"
  expect_done "/i newer over older"
  local entries
  entries=$(wine reg query 'HKLM\SOFTWARE\Microsoft\Windows\CurrentVersion\Uninstall' /s /v DisplayName </dev/null 2>/dev/null |
    grep -c 'Mapora Administrator')
  expect "Add/Remove Programs entries after the upgrade" "$entries" 1
  expect "DisplayVersion after the upgrade" "$(reg_value "$uninstall_key" DisplayVersion)" "$version"
  expect_file "console after the upgrade" "$bin\\MaporaAdmin.exe" yes
  msiexec /i "$(windows_path "$package")" REMOVE=Lang_de
  expect_done "REMOVE=Lang_de"
  expect_file "German pack after REMOVE=Lang_de" "$suite\\bin\\de\\ResMaporaAdmin.dll" no
  expect_file "French pack after REMOVE=Lang_de" "$suite\\bin\\fr\\ResMaporaAdmin.dll" yes

  msiexec /i "$(windows_path "$older")"
  case $code in 67 | 102) ;; *) fail "msiexec /i older over newer exited with $code, expected 1603 or 1638 (67 or 102)" ;; esac
  # Wine logs no message box text under /qn: the log shows the newer product found and the launch
  # condition that stops on it, and the package carries the message Windows shows.
  local found
  found=$(sed -n 's/^Property(S): WIX_DOWNGRADE_DETECTED = \(.*\)$/\1/p' "$log" | tr -d '\r')
  expect "newer product found by the older package (log $log)" "$found" "$product_code"
  expect "the older package's launch condition" "$(msiinfo export "$older" LaunchCondition | tr -d '\r' | tail -n 1)" \
    "NOT WIX_DOWNGRADE_DETECTED	A newer version of Mapora Administrator is already installed. To install this version, first uninstall the newer one."
  expect "DisplayVersion after the refused downgrade" "$(reg_value "$uninstall_key" DisplayVersion)" "$version"
}

"$scenario"
wineserver -k 2>/dev/null
wineserver -w 2>/dev/null
[ "$failures" -eq 0 ] && rm -rf "$WINEPREFIX"
exit "$failures"
