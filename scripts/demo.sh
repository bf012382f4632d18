#!/usr/bin/env bash
# Demo: installs what is missing, builds, and takes qmMrvONI.exe along the road
# users take, in a scratch Wine prefix seeded with a small simulated machine:
#   - Lotus Notes 8 in C:\Program Files\IBM\Lotus\Notes, with its data folder
#     and the embedded Sametime's Eclipse configuration;
#   - IBM Sametime Connect 8 in C:\Program Files\IBM\Sametime Connect, found
#     through its uninstall entry;
#   - a Sametime 8 profile whose Eclipse platform.xml does not list the meeting
#     feature yet;
#   - the suite's companion meeting application, registered by Windows
#     Installer under one of the suite's upgrade codes: the suite's Start-menu
#     folder is named after it.
# The suite's installer package (build/bin/installer/QuillmarkTools.msi) is
# installed with msiexec, which runs the program as its custom actions; the
# suite is then used (the steps that call the installed program directly) and
# finally uninstalled. Each step prints the trace records and exit codes and
# what changed on the machine; the last one shows what the road left behind.
# The prefix is removed at the end.
set -euo pipefail
here=$(cd "$(dirname "$0")/.." && pwd)
"$here/scripts/install-deps.sh"
"$here/scripts/build.sh" --target qmMrvONI qm_fakes demo_runner QuillmarkTools_msi >/dev/null

build="$here/build"
"$here/tests/wine/prefix.sh" template "$build/wine/template"
prefix="$build/wine/demo-$$"
"$here/tests/wine/prefix.sh" clone "$build/wine/template" "$prefix"
trap '"$here/tests/wine/prefix.sh" remove "$prefix"' EXIT
export WINEPREFIX="$prefix" WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml="
wineserver -p 60

c="$prefix/drive_c"
package="$(winepath -w "$build/bin/installer/QuillmarkTools.msi")"
product='{5C0F3A1E-7B2D-4E69-9A41-2D8E6B7C1F30}'
# The package installs the suite here (a 32-bit package on 64-bit Windows).
suite="$c/Program Files (x86)/Quillmark Tools"
notes="$c/Program Files/IBM/Lotus/Notes"
sametime="$c/Program Files/IBM/Sametime Connect"
user=$(ls "$c/users" | grep -v -x -e Public | head -n 1)
appdata="$c/users/$user/AppData/Roaming"
config="$appdata/Lotus/Sametime/.config/org.eclipse.update"
startmenus=("$c/ProgramData/Microsoft/Windows/Start Menu/Programs"
            "$appdata/Microsoft/Windows/Start Menu/Programs")
desktops=("$c/users/Public/Desktop" "$c/users/$user/Desktop")

# The program is 32-bit: machine keys go to the 32-bit registry view.
reg() { wine reg add "$@" /reg:32 /f >/dev/null; }
section() { printf '\n== %s\n' "$1"; }
listing() { (cd "$1" && find . -type f | sed 's|^\./||' | sort | sed 's/^/    /'); }
shortcuts() {
  local folder found
  for folder in "${startmenus[@]}" "${desktops[@]}"; do
    found=$(cd "$folder" && find . -name '*.lnk' | sed 's|^\./||' | sort)
    [ -n "$found" ] || continue
    echo "  ${folder#"$c/"}:"
    while IFS= read -r link; do echo "    $link"; done <<< "$found"
  done
}

# The files (with a checksum) and registry values of the products concerned,
# one line each; the suite's own folders by their number of files. Desktops
# may be host links to the home folder: only their shortcuts are listed.
snapshot() {
  local root key view
  for root in "$suite" "$c/ProgramData/Mirovan/Quillmark Tools/Setup"; do
    if [ -d "$root" ]; then echo "files ${root#"$c/"}: $(find "$root" -type f | wc -l)"; fi
  done
  for root in "$notes" "$sametime" "$appdata/Lotus" "$appdata/IBM" "$appdata/Mirovan" \
              "$c/ProgramData/Mirovan" "${startmenus[@]}"; do
    [ -d "$root" ] || continue
    (cd "$root" && find . -type f ! -path './Quillmark Tools/Setup/*' -exec md5sum {} +) |
      while read -r sum file; do echo "file ${root#"$c/"}/${file#./} (${sum:0:8})"; done
  done
  for root in "${desktops[@]}"; do
    find "$root/" -maxdepth 1 -name '*.lnk' 2>/dev/null | sed "s|^$c/|file |" || true
  done
  for key in 'HKLM\SOFTWARE\Mirovan' 'HKLM\SOFTWARE\Policies\Microsoft' 'HKCU\Software\Mirovan' \
             'HKCU\Software\Microsoft\Office\Common\Smart Tag' \
             "HKLM\\Software\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\$product:64"; do
    view=${key##*:}; [ "$view" = "$key" ] && view=32
    wine reg query "${key%:64}" /s /reg:$view 2>/dev/null | tr -d '\r' | grep -v '^reg:' |
      awk '/^HKEY/ { key = $0; print "key " key; next } NF { sub(/^ +/, ""); print "value " key "\\" $0 }' ||
      true
  done
  for value in Path PendingFileRenameOperations; do
    wine reg query 'HKLM\System\CurrentControlSet\Control\Session Manager' /s /v "$value" \
      2>/dev/null | tr -d '\r' | grep -i "^ *$value " | sed 's/^ */value /' || true
  done
}
# What changed between two snapshots, by item: "-" only before, "+" only
# after (a changed file shows as both).
changes() {
  { comm -23 <(sort "$1") <(sort "$2") | sed 's/^/- /'
    comm -13 <(sort "$1") <(sort "$2") | sed 's/^/+ /'; } | sort -s -k2 | sed 's/^/    /'
}

section "Seeding the simulated machine"
mkdir -p "$notes/Data/workspace/.config/org.eclipse.update" \
         "$notes/Data/workspace/applications/eclipse/plugins" \
         "$notes/Data/workspace/applications/eclipse/features" \
         "$sametime/rcp" "$sametime/shared/eclipse/plugins" "$sametime/shared/eclipse/features" \
         "$sametime/configuration/org.eclipse.update" "$config"
echo "Notes' own program" > "$notes/notes.exe"
echo "Notes' own URL handler, never replaced nor removed" > "$notes/NIURL.dll"
echo "an earlier release's copy of the plug-in's resources" > "$notes/qmnires.dll"
echo "[Notes]" > "$notes/Data/notes.ini"
reg 'HKLM\SOFTWARE\Lotus\Notes\8.0' /v Path /d 'C:\Program Files\IBM\Lotus\Notes'
reg 'HKLM\SOFTWARE\Lotus\Notes\8.0' /v DataPath /d 'C:\Program Files\IBM\Lotus\Notes\Data'
uninstall='HKLM\Software\Microsoft\Windows\CurrentVersion\Uninstall\IBM Sametime Connect'
reg "$uninstall" /v DisplayName /d 'IBM Lotus Sametime Connect 8.5'
reg "$uninstall" /v InstallLocation /d 'C:\Program Files\IBM\Sametime Connect'
reg "$uninstall" /v VersionMajor /t REG_DWORD /d 8
touch "$sametime/configuration/org.eclipse.update/last.config.stamp"
eclipse_config() {  # folder, site url
  cat > "$1/platform.xml" <<XML
<?xml version="1.0" encoding="UTF-8"?>
<config date="1700000000000" transient="false" version="3.0">
<site enabled="true" policy="USER-EXCLUDE" updateable="true" url="$2">
<feature id="com.example.other.feature" url="features/com.example.other.feature_2.0.0/" version="2.0.0">
</feature>
</site>
</config>
XML
  touch "$1/last.config.stamp"
}
wine reg add 'HKLM\Software\Microsoft\Windows\CurrentVersion\Installer\UpgradeCodes\1A705790D0FBFFE4DBC7B0F099009CD9' \
  /v 39A1EB3B91C93B54EAD80FE3C665084C /d '' /reg:64 /f >/dev/null
wine reg add 'HKLM\SOFTWARE\Microsoft\Windows\CurrentVersion\Uninstall\{B3BE1A93-9C19-45B3-AE8D-F03E6C5680C4}' \
  /v DisplayName /d 'Mirovan Meeting Center' /reg:64 /f >/dev/null
eclipse_config "$config" "file:../shared/eclipse/"
eclipse_config "$notes/Data/workspace/.config/org.eclipse.update" \
               "platform:/config/../applications/eclipse/"
echo "  Notes folder: C:\\Program Files\\IBM\\Lotus\\Notes"
listing "$notes"
echo "  Sametime Connect folder: C:\\Program Files\\IBM\\Sametime Connect"
listing "$sametime"
echo "  companion application: Mirovan Meeting Center"
snapshot > "$prefix/machine.before"

# Runs the installed program with each argument as its command line.
# Wine's helper processes would hold a pipe open: output goes through a file.
run() {
  wine "$build/bin/demo/demo_runner.exe" "$(winepath -w "$suite")" "$@" > "$prefix/run.out" 2>&1
  tr -d '\r' < "$prefix/run.out"
}
# Runs msiexec with these arguments and prints the trace records of the
# custom actions it ran (each run starts with its NIHandle record).
msiexec() {
  rm -f "$c/msi-trace.log"
  local code=0
  QM_FAKE_TRACE_LOG='C:\msi-trace.log' wine msiexec "$@" /qn > "$prefix/msi.out" 2>&1 || code=$?
  echo "\$ msiexec $* /qn"
  wine "$build/bin/demo/demo_runner.exe" --trace 'C:\msi-trace.log' > "$prefix/run.out" 2>&1
  tr -d '\r' < "$prefix/run.out" | sed 's/^\(  trace \[level 2\] NIHandle\)/\n\1/'
  echo "  msiexec exit code: $code"
}

# Each step of the road lives in scripts/demo.d, run in the order of its
# number: 1x-3x install, 4x-6x use, 7x-9x uninstall.
for step in "$here"/scripts/demo.d/*.sh; do
  # shellcheck source=/dev/null
  source "$step"
done
