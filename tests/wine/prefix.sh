#!/usr/bin/env bash
# Scratch Wine prefixes for the tests.
#   prefix.sh template DIR          create DIR once (null display driver)
#   prefix.sh clone TEMPLATE DIR    a fresh copy of TEMPLATE at DIR
#   prefix.sh remove DIR            stop its wineserver and delete it
# A clone hard-links the large system libraries of the template (Wine never
# writes them) and copies everything a test or Wine may change.
set -euo pipefail
export WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml=;winemenubuilder.exe=d"

command=${1:?usage}; shift
case "$command" in
  template)
    dir=$1
    if [ -f "$dir/.qm-template-v2" ]; then exit 0; fi
    rm -rf "$dir"; mkdir -p "$(dirname "$dir")"
    WINEPREFIX="$dir" wineboot --init >/dev/null 2>&1
    WINEPREFIX="$dir" wine reg add 'HKCU\Software\Wine\Drivers' /v Graphics /d null /f >/dev/null 2>&1
    # A crash ends the process at once instead of waiting behind a dialog.
    WINEPREFIX="$dir" wine reg add 'HKCU\Software\Wine\WineDbg' /v ShowCrashDialog /t REG_DWORD /d 0 /f >/dev/null 2>&1
    # Wine's menu builder turns every shortcut saved under the Start menu or on
    # the desktop into menu entries, icons and .desktop files in the host
    # user's home folder: disabled, during the boot too.
    WINEPREFIX="$dir" wine reg add 'HKCU\Software\Wine\DllOverrides' /v winemenubuilder.exe /d "" /f >/dev/null 2>&1
    WINEPREFIX="$dir" wineserver -w
    # The user's shell folders (Desktop, Documents...) are host links to the
    # Unix home folder: real folders instead, so that nothing a test or the
    # demo writes or deletes there reaches the host.
    for link in "$dir"/drive_c/users/*/*; do
      if [ -L "$link" ]; then rm -f "$link" && mkdir "$link"; fi
    done
    touch "$dir/.qm-template-v2"
    ;;
  clone)
    template=$1; dir=$2
    [ -f "$template/.qm-template-v2" ] || { echo "no template at $template" >&2; exit 1; }
    if [ -d "$dir" ]; then WINEPREFIX="$dir" wineserver -k 2>/dev/null || true; rm -rf "$dir"; fi
    cp -al "$template" "$dir"
    # Real copies of everything but the system folders' libraries.
    find "$dir" -type f ! -path '*/drive_c/windows/system32/*' \
        ! -path '*/drive_c/windows/syswow64/*' ! -path '*/drive_c/windows/winsxs/*' \
        -exec sh -c 'for f; do cp -p --remove-destination "$f" "$f.qmcopy" && mv -f "$f.qmcopy" "$f"; done' _ {} +
    rm -f "$dir/.qm-template-v2"
    ;;
  remove)
    dir=$1
    if [ -d "$dir" ]; then
      WINEPREFIX="$dir" wineserver -k 2>/dev/null || true
      rm -rf "$dir"
    fi
    ;;
  *) echo "unknown command $command" >&2; exit 2 ;;
esac
