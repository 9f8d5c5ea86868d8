#!/usr/bin/env bash
# The x64 package under Wine, each scenario in a Wine prefix of its own, created afresh:
#
#   installer-test.sh lifecycle BUILD_DIR   install, what it put in place, the console and the
#                                           report, the optional feature, repair, uninstall
#   installer-test.sh upgrade BUILD_DIR     two languages chosen, major upgrade, downgrade refused
#   installer-test.sh signed BUILD_DIR MSI  the signing tests' package MSI installed, tried in a
#                                           folder beside it
#
# BUILD_DIR is the x64 tree; its Xvfb display (fixture "wine") shows the console. The exit code is
# the number of failed checks.
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

source "$source_dir/tests/support/checks.sh"

unix_path() { local p=${1#[Cc]:}; echo "$WINEPREFIX/drive_c${p//\\//}"; }
windows_path() { echo "Z:$(realpath -m "$1" | tr / '\\')"; }
# exists 'C:\path': yes or no.
exists() { [ -n "$1" ] && [ -e "$(unix_path "$1")" ] && echo yes || echo no; }
# msi EXPECTED ARGS...: msiexec ARGS quietly, with a verbose log next to the prefix ($log); its exit
# code must match EXPECTED (a regular expression). Wine passes the code on modulo 256: 1603
# arrives as 67, 1638 as 102.
run=0
msi() {
  local want=$1 code
  shift
  run=$((run + 1)) && log="$work/msiexec-$run.log"
  wine msiexec "$@" /qn /l*v "$(windows_path "$log")" </dev/null >/dev/null 2>&1
  code=$?
  [[ $code =~ ^($want)$ ]] || fail "msiexec $*: exited with $code, expected $want (log: $log)"
}

# A value of the registry as `reg query` shows it, or nothing.
reg_value() {
  wine reg query "$1" /v "$2" </dev/null 2>/dev/null | tr -d '\r' |
    awk -v name="$2" '{ line = $0; sub(/^ +/, "", line) } index(line, name " ") == 1 {
      sub(/^[^ ]+( [^ ]+)* +REG_[A-Z_]+ +/, "", line); print line }'
}

# A property as the last msiexec run logged it, and one of a package.
logged_property() { tr -d '\r' <"$log" | sed -n "s/^Property(S): $1 = //p"; }
property() { msiinfo export "$1" Property | tr -d '\r' | awk -F'\t' -v name="$2" '$1 == name { print $2 }'; }

version=$(sed -n 's/^project(MaporaAdmin VERSION \([0-9.]*\).*/\1/p' "$source_dir/CMakeLists.txt")
[ -n "$package" ] || package="$build/installer/MaporaAdmin-$version-x64.msi"
[ -f "$package" ] || { echo "FAILED: $package has not been built" >&2; exit 1; }
msi_path=$(windows_path "$package")
product_code=$(property "$package" ProductCode)
uninstall_key="HKLM\\SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\$product_code"
bin='C:\Program Files (x86)\Common Files\Mapora\bin'
suite='C:\Program Files\Common Files\Mapora'

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

# The language packs installed, by folder name.
installed_packs() { (cd "$(unix_path "$suite\\bin")" && ls -d */ResMaporaAdmin.dll 2>/dev/null) | sed 's|/.*||' | LC_ALL=C sort | xargs; }
# Add/Remove Programs' name, publisher, version and help link.
uninstall_entry() { for v in DisplayName Publisher DisplayVersion HelpLink; do reg_value "$uninstall_key" $v; done | paste -sd';'; }
# yes once the console's window shows, no if it has not within 30 s.
console_shown() {
  for _ in $(seq 1 60); do xwininfo -root -tree 2>/dev/null | grep -q '"Mapora Administrator"' && echo yes && return; sleep 0.5; done
  echo no
}

lifecycle() {
  snapshot >"$work/before.txt"
  msi 0 /i "$msi_path"
  local lnk icon
  # Wine keeps the per-user Start menu for per-machine packages; the log says which it took.
  lnk=$(logged_property ProgramMenuFolder) && lnk=${lnk%\\}
  # Add/Remove Programs shows the icon that the product's registration names.
  icon=$(wine reg query 'HKLM\Software\Classes\Installer\Products' /s /v ProductIcon </dev/null 2>/dev/null |
    tr -d '\r' | sed -n 's/^ *ProductIcon *REG_SZ *//p')
  wine "$bin\\MaporaAdmin.exe" </dev/null >/dev/null 2>&1 &
  checks <<'EOF'
installed console's window shown|yes|console_shown
console|yes|exists "$bin\\MaporaAdmin.exe"
language packs|ar de es fr ja zh-CN|installed_packs
policy templates (off by default)|no|exists 'C:\windows\PolicyDefinitions\Mapora.admx'
Start-menu shortcut|yes|exists "$lnk\\Mapora Administrator.lnk"
Add/Remove Programs entry|Mapora Administrator;Kvel;$version;https://support.kvel.example|uninstall_entry
product icon's file name|MaporaAdmin.ico|echo "${icon##*\\}"
product icon|yes|exists "$icon"
installed MaporaReport --json, first character|{|eval 'wine "$bin\\MaporaReport.exe" --json 2>/dev/null | head -c 1'
EOF
  wineserver -k 2>/dev/null
  wait

  # The optional feature on request, in maintenance mode. Then repair brings a deleted program
  # back: Wine's msiexec does not implement /f, so it is asked for by the properties /fa stands for.
  msi 0 /i "$msi_path" ADDLOCAL=PolicyTemplates
  rm -f "$(unix_path "$bin\\MaporaAdmin.exe")"
  msi 0 /i "$msi_path" REINSTALL=ALL REINSTALLMODE=a
  checks <<'EOF'
ADMX|yes|exists 'C:\windows\PolicyDefinitions\Mapora.admx'
Japanese ADML|yes|exists 'C:\windows\PolicyDefinitions\ja-JP\Mapora.adml'
console after repair|yes|exists "$bin\\MaporaAdmin.exe"
EOF

  # What users and policies write belongs to the suite and stays; everything else goes.
  kept=('HKCU\Software\KVEL|UILANGID' 'HKLM\SOFTWARE\KVEL\Desktop10.5\Settings|EnableKUEI'
    'HKCU\Software\KVEL\Mapora Connection\Settings|Support Local Portal'
    'HKLM\SOFTWARE\KVEL\Mapora Connection\Settings|Portal Server Set By Admin')
  for entry in "${kept[@]}"; do wine reg add "${entry%|*}" /v "${entry#*|}" /t REG_DWORD /d 1 /f </dev/null >/dev/null 2>&1; done
  msi 0 /x "$msi_path"
  check "${kept[*]} after uninstall" "0x1;0x1;0x1;0x1" kept_values
  snapshot >"$work/after.txt"
  check "registry and files after uninstall, against before install" "" left_behind
}

kept_values() { for entry in "${kept[@]}"; do reg_value "${entry%|*}" "${entry#*|}"; done | paste -sd';'; }
# What differs after uninstall apart from the kept values and the keys that hold them. Wine leaves
# the installer's own registration keys, empty, and its cache folder, which Windows always has.
left_behind() {
  diff "$work/before.txt" "$work/after.txt" | grep '^[<>]' |
    grep -v -E '^> \[HKEY_LOCAL_MACHINE\\Software\\(Classes\\Installer|Microsoft\\Windows\\CurrentVersion\\Installer)(\\[^]]*)?\]$' |
    grep -v -x -F '> ./windows/Installer' |
    grep -v -i -E '^> \[HKEY_(LOCAL_MACHINE\\Software|CURRENT_USER\\Software)\\KVEL(\\Desktop10\.5(\\Settings)?|\\Mapora Connection(\\Settings)?)?\]$' |
    grep -v -E '"(UILANGID|EnableKUEI|Support Local Portal|Portal Server Set By Admin)"=dword'
}

upgrade() {
  # A package of the same files with a lower version, built here as the build builds its own.
  local older_version older
  older_version="${version%.*}.$((${version##*.} - 1))"
  older="$work/MaporaAdmin-$older_version-x64.msi"
  cmake -DSTAGING_DIR="$build/installer/staging" -DARCH=x64 -DVERSION="$older_version" -DOUTPUT="$older" \
    -P "$source_dir/installer/BuildPackage.cmake" >/dev/null || fail "building $older"
  checks <<'EOF'
UpgradeCode of the older package|$(property "$package" UpgradeCode)|property "$older" UpgradeCode
component GUIDs of both versions|$(msiinfo export "$package" Component)|msiinfo export "$older" Component
ProductCode of the older package differs|no|eval '[ "$(property "$older" ProductCode)" = "$product_code" ] && echo yes || echo no'
EOF

  msi 0 /i "$(windows_path "$older")" ADDLOCAL=Console,Lang_fr,Lang_de
  check "packs with ADDLOCAL=Console,Lang_fr,Lang_de" "de fr" installed_packs
  msi 0 /i "$msi_path"
  checks <<'EOF'
Add/Remove Programs entries after the upgrade|1|eval 'wine reg query "HKLM\SOFTWARE\Microsoft\Windows\CurrentVersion\Uninstall" /s /v DisplayName 2>/dev/null | grep -c "Mapora Administrator"'
DisplayVersion after the upgrade|$version|reg_value "$uninstall_key" DisplayVersion
console after the upgrade|yes|exists "$bin\\MaporaAdmin.exe"
EOF
  msi 0 /i "$msi_path" REMOVE=Lang_de
  check "German pack after REMOVE=Lang_de" no exists "$suite\\bin\\de\\ResMaporaAdmin.dll"
  check "French pack after REMOVE=Lang_de" yes exists "$suite\\bin\\fr\\ResMaporaAdmin.dll"

  # Refused with 1603 or 1638. Wine logs no message box text under /qn: the log shows the newer
  # product found and the launch condition that stops on it, and the package carries the message.
  msi '67|102' /i "$(windows_path "$older")"
  checks <<'EOF'
newer product found by the older package (log $log)|$product_code|logged_property WIX_DOWNGRADE_DETECTED
the older package's launch condition|NOT WIX_DOWNGRADE_DETECTED	A newer version of Mapora Administrator is already installed. To install this version, first uninstall the newer one.|eval 'msiinfo export "$older" LaunchCondition | tr -d "\r" | tail -n 1'
DisplayVersion after the refused downgrade|$version|reg_value "$uninstall_key" DisplayVersion
EOF
}

# The signing tests' package: installed, with a console whose signature verifies against the
# throwaway root beside the package. The install lifecycle itself is the lifecycle scenario's.
signed() {
  msi 0 /i "$msi_path"
  check "installed console's signature" pass eval 'osslsigncode verify -CAfile "$(dirname "$package")/root.pem" \
    -in "$(unix_path "$bin\\MaporaAdmin.exe")" >"$work/verify.log" 2>&1 && echo pass || cat "$work/verify.log"'
}

"$scenario"
wineserver -k 2>/dev/null
wineserver -w 2>/dev/null
[ "$failures" -eq 0 ] && rm -rf "$WINEPREFIX"
exit "$failures"
