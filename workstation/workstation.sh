#!/usr/bin/env bash
# The sample workstation: a Wine prefix of its own in which Mapora Desktop 10.5 and Mapora Engine
# 10.5 with Service Pack 1 are installed, and the console that runs on it.
#
#   workstation/workstation.sh provision BUILD_DIR   create the prefix, or bring it up to date,
#                                                    from an x64 build tree (build/x64)
#   workstation/workstation.sh check-display         fail with advice when no X display is usable
#   workstation/workstation.sh open [ARGS...]        start the console on it (ARGS go to the console)
#
# The prefix is build/workstation/prefix (MAPORA_WORKSTATION_PREFIX overrides it). Its Windows is
# 64-bit: 32-bit Wine is not available from our package mirror, so it runs the x64 console.
#
# Provisioning runs the steps listed in STEPS, in order, on every `provision`. Each step is
# idempotent: it overwrites what it installs, so re-running keeps an existing prefix current.
# To add a step, write a function step_<name> beside the others, using the paths of "Workstation
# layout" and the helpers below, and add <name> to STEPS where it has to run (after "prefix"; a
# step that needs the products installed goes after "products"). Put its data files in this
# folder; a built file it needs must be made by the target "workstation" (workstation/CMakeLists.txt),
# which tools/run.sh builds.
set -euo pipefail

here=$(cd "$(dirname "$0")" && pwd)
root=$(dirname "$here")

export WINEPREFIX="${MAPORA_WORKSTATION_PREFIX:-$root/build/workstation/prefix}"
# No menu builder: the package's Start-menu shortcut would otherwise land in this machine's own
# desktop menus.
export WINEARCH=win64 WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml=;winemenubuilder.exe=d"

# --- Workstation layout (Windows paths) -----------------------------------------------------
PROGRAM_FILES_X86='C:\Program Files (x86)'
# <Common Files> as the 64-bit console sees it: the base of the language packs (Mapora\bin\<lang>).
COMMON_FILES='C:\Program Files\Common Files'
# The 32-bit common program files folder; "&Advanced..." shows only for a console started in it.
COMMON_FILES_X86="$PROGRAM_FILES_X86\\Common Files"
# The products' InstallDir values (products.reg holds the same paths).
DESKTOP_DIR="$PROGRAM_FILES_X86\\Kvel\\Desktop10.5"
ENGINE_DIR="$PROGRAM_FILES_X86\\Kvel\\Engine10.5"
CONSOLE_DIR="$COMMON_FILES_X86\\Mapora\\bin"
CONSOLE_EXE="$CONSOLE_DIR\\MaporaAdmin.exe"
# Where the stand-ins of suite components that the console talks to are installed.
STANDINS_DIR="$COMMON_FILES\\Kvel\\bin"

STEPS=(prefix virtual_desktop fonts products runtime_info portal_manager console product_language_packs)

# --- Helpers ----------------------------------------------------------------------------------
die() { echo "workstation: $*" >&2; exit 1; }

# The Unix path of a C: path inside the prefix.
unix_path() {
  local path=${1#[Cc]:}
  echo "$WINEPREFIX/drive_c${path//\\//}"
}

# A file of the build tree; stops when it has not been built.
built() {
  [ -f "$BUILD/$1" ] || die "$BUILD/$1 is missing; build the x64 tree first (cmake --build --preset x64)"
  echo "$BUILD/$1"
}

# install_file SOURCE 'C:\folder\name': copies a file into the prefix, creating its folders.
install_file() {
  local target
  target=$(unix_path "$2")
  mkdir -p "$(dirname "$target")"
  cp -f "$1" "$target"
}

wine_quiet() { wine "$@" </dev/null >/dev/null 2>&1; }

# The Windows path of a Unix path (Wine's Z: drive).
windows_path() { echo "Z:$(realpath -m "$1" | tr / '\\')"; }

# The ProductCode of a package, read back from its Property table.
package_product_code() {
  msiinfo export "$1" Property | awk -F'\t' '$1 == "ProductCode" { print $2 }' | tr -d '\r'
}

# Imports .reg text (REGEDIT4, from a file or stdin) into the prefix's registry. With --both-views
# the keys under HKEY_LOCAL_MACHINE\SOFTWARE go into the 32-bit view (Wow6432Node) as well.
import_registry() {
  local both=false
  if [ "${1:-}" = --both-views ]; then both=true; shift; fi
  local file="$WINEPREFIX/../import.reg" text
  text=$(cat "${1:-/dev/stdin}")
  {
    echo "$text"
    if $both; then
      echo "$text" | sed -e 1d -e 's/^\[HKEY_LOCAL_MACHINE\\SOFTWARE\\/[HKEY_LOCAL_MACHINE\\SOFTWARE\\Wow6432Node\\/'
    fi
  } > "$file"
  wine_quiet regedit /S "$(windows_path "$file")" || die "registry import failed"
  rm -f "$file"
}

# --- Steps ------------------------------------------------------------------------------------
step_prefix() {
  if [ ! -f "$WINEPREFIX/system.reg" ]; then
    echo "Creating the workstation's Wine prefix in $WINEPREFIX"
    mkdir -p "$WINEPREFIX"
    wine_quiet wineboot -i || die "wineboot could not create $WINEPREFIX"
  fi
}

# Wine's virtual desktop draws Windows' own window frames.
step_virtual_desktop() {
  import_registry <<'EOF'
REGEDIT4

[HKEY_CURRENT_USER\Software\Wine\Explorer]
"Desktop"="Default"

[HKEY_CURRENT_USER\Software\Wine\Explorer\Desktops]
"Default"="1024x768"
EOF
}

# Wine's own fonts, which this Wine build does not put into new prefixes, and the CJK font mapping.
step_fonts() {
  "$root/tools/wine-fonts.sh" "$WINEPREFIX"
}

# Installation records, the Desktop installation marker and each product's core library.
step_products() {
  import_registry --both-views "$here/products.reg"
  local pfcore dir
  pfcore=$(built workstation/pfcore.dll)
  for dir in "$DESKTOP_DIR" "$ENGINE_DIR"; do install_file "$pfcore" "$dir\\bin\\pfcore.dll"; done
}

# The suite's runtime-information component (our stand-in) reports both runtimes as installed.
step_runtime_info() {
  install_file "$(built standins/runtime-info/SuiteRuntimeInfo.dll)" "$STANDINS_DIR\\SuiteRuntimeInfo.dll"
  wine_quiet regsvr32 /s "$STANDINS_DIR\\SuiteRuntimeInfo.dll" || die "regsvr32 SuiteRuntimeInfo.dll failed"
  wine_quiet reg add 'HKLM\SOFTWARE\KVEL\RuntimeInfo' /v Runtimes /t REG_MULTI_SZ \
    /d '1 10.5 Desktop runtime\02 10.5 Engine runtime' /f || die "could not configure the runtime list"
}

# The portal connection manager (our stand-in) behind "Manage Portal Connections...".
step_portal_manager() {
  install_file "$(built standins/portal-manager/PortalManager.dll)" "$STANDINS_DIR\\PortalManager.dll"
  wine_quiet regsvr32 /s "$STANDINS_DIR\\PortalManager.dll" || die "regsvr32 PortalManager.dll failed"
}

# The console, the headless report and the language packs, from the x64 package, as
# administrators install them. The same version already installed is reinstalled from the new
# package, every file overwritten, so that a rebuilt console replaces the one in the prefix.
step_console() {
  local package log code mode=() doing=Installing
  package="$BUILD/installer/$(cat "$(built installer/package-name.txt)")"
  [ -f "$package" ] || die "$package is missing; build the x64 tree first (cmake --build --preset x64)"
  log="$WINEPREFIX/../msiexec.log"
  code=$(package_product_code "$package")
  if wine_quiet reg query "HKLM\\SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\$code"; then
    mode=(REINSTALL=ALL REINSTALLMODE=vamus)
    doing=Reinstalling
  fi
  echo "$doing $(basename "$package")"
  wine_quiet msiexec /i "$(windows_path "$package")" "${mode[@]}" /qn /l*v "$(windows_path "$log")" ||
    die "$doing $package failed; see $log"
}

# The products' own copies of the language packs in their bin folders, which Advanced Configuration
# lists, and the Desktop product's help file with its French translation, which the console opens
# from there (the package puts only the console's own packs, under <Common Files>\Mapora).
step_product_language_packs() {
  local pack tag dir help=administering_mapora_desktop.chm
  for pack in "$BUILD"/packs/*/ResMaporaAdmin.dll; do
    [ -f "$pack" ] || die "$BUILD/packs holds no language pack; build the x64 tree first"
    tag=$(basename "$(dirname "$pack")")
    for dir in "$DESKTOP_DIR" "$ENGINE_DIR"; do
      install_file "$pack" "$dir\\bin\\$tag\\ResMaporaAdmin.dll"
    done
  done
  install_file "$(built "help-files/$help")" "$DESKTOP_DIR\\help\\$help"
  install_file "$(built "help-files/fr/$help")" "$DESKTOP_DIR\\help\\fr\\$help"
}

# --- Commands ---------------------------------------------------------------------------------
check_display() {
  if [ -z "${DISPLAY:-}" ]; then
    cat >&2 <<'EOF'
The console needs an X display, and DISPLAY is not set.
Run it from a desktop session, over ssh -X, or on a virtual display:
  xvfb-run -s "-screen 0 1280x1024x24" tools/run.sh
EOF
    exit 3
  fi
  if command -v xdpyinfo >/dev/null && ! xdpyinfo >/dev/null 2>&1; then
    echo "No X server answers on DISPLAY=$DISPLAY; start one or point DISPLAY at it." >&2
    exit 3
  fi
}

case "${1:-}" in
  provision)
    [ $# -eq 2 ] || die "usage: $0 provision BUILD_DIR"
    BUILD=$(cd "$2" && pwd)
    for step in "${STEPS[@]}"; do "step_$step"; done
    echo "Workstation ready: $WINEPREFIX"
    ;;
  check-display) check_display ;;
  open)
    shift
    check_display
    [ -f "$(unix_path "$CONSOLE_EXE")" ] || die "the workstation is not provisioned; run: $0 provision build/x64"
    exec wine "$CONSOLE_EXE" "$@"
    ;;
  *) echo "usage: $0 provision BUILD_DIR | check-display | open [ARGS...]" >&2; exit 2 ;;
esac
