#!/usr/bin/env bash
# Demo: installs what is missing, builds, and runs qmMrvONI.exe's main jobs in
# a scratch Wine prefix seeded with a small simulated machine:
#   - the suite installed in C:\Program Files\Quillmark Tools (registry "Path"),
#     holding the plug-in files;
#   - Lotus Notes 8 in C:\Program Files\IBM\Lotus\Notes, found through the registry;
#   - a Sametime 8 profile whose Eclipse platform.xml does not list the meeting
#     feature yet.
# For each command it prints the trace records and the exit code, then shows
# what changed. The prefix is removed at the end.
set -euo pipefail
here=$(cd "$(dirname "$0")/.." && pwd)
"$here/scripts/install-deps.sh"
"$here/scripts/build.sh" --target qmMrvONI qm_fakes demo_runner >/dev/null

build="$here/build"
"$here/tests/wine/prefix.sh" template "$build/wine/template"
prefix="$build/wine/demo-$$"
"$here/tests/wine/prefix.sh" clone "$build/wine/template" "$prefix"
trap '"$here/tests/wine/prefix.sh" remove "$prefix"' EXIT
export WINEPREFIX="$prefix" WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml="
wineserver -p 60

c="$prefix/drive_c"
suite="$c/Program Files/Quillmark Tools"
notes="$c/Program Files/IBM/Lotus/Notes"
user=$(ls "$c/users" | grep -v -x -e Public | head -n 1)
appdata="$c/users/$user/AppData/Roaming"
config="$appdata/Lotus/Sametime/.config/org.eclipse.update"

# The program is 32-bit: machine keys go to the 32-bit registry view.
reg() { wine reg add "$@" /reg:32 /f >/dev/null; }
section() { printf '\n== %s\n' "$1"; }
listing() { (cd "$1" && find . -type f | sed 's|^\./||' | sort | sed 's/^/    /'); }

section "Seeding the simulated machine"
mkdir -p "$suite" "$notes/Data" "$config"
for f in lcppn30.dll ndbmrvqm.dll qmnires.dll NIURL.dll qmMRVURL.DLL qmnwintc.dll mirovan.nsf \
         qmniscpt.xml qmniupd.exe mirovanni.chm qmONIUI.dll qmOI3Res.dll qmmrvjni.dll \
         com.mrv.realtime.meeting_1.0.1.jar feature.xml msvcr120.dll msvcp120.dll; do
  echo "suite build 2.0 copy of $f" > "$suite/$f"
done
echo "old copy held by Notes" > "$notes/qmnires.dll"
echo "Notes' own URL handler, never replaced nor removed" > "$notes/NIURL.dll"
echo "the user's meeting database" > "$notes/mirovan.nsf"
cp "$build/bin/qmMrvONI.exe" "$build/bin/fakes/mrvtrace.dll" "$build/bin/fakes/qmusredt.dll" "$suite/"
reg 'HKLM\SOFTWARE\Mirovan\QmkTools' /v Path /d 'C:\Program Files\Quillmark Tools'
reg 'HKLM\SOFTWARE\Lotus\Notes\8.0' /v Path /d 'C:\Program Files\IBM\Lotus\Notes'
reg 'HKLM\SOFTWARE\Lotus\Notes\8.0' /v DataPath /d 'C:\Program Files\IBM\Lotus\Notes\Data'
cat > "$config/platform.xml" <<'XML'
<?xml version="1.0" encoding="UTF-8"?>
<config date="1700000000000" transient="false" version="3.0">
<site enabled="true" policy="USER-EXCLUDE" updateable="true" url="file:../shared/eclipse/">
<feature id="com.example.other.feature" url="features/com.example.other.feature_2.0.0/" version="2.0.0">
</feature>
</site>
</config>
XML
touch "$config/last.config.stamp"
echo "  suite folder: C:\\Program Files\\Quillmark Tools"
listing "$suite"
echo "  Notes folder: C:\\Program Files\\IBM\\Lotus\\Notes"
listing "$notes"

# Wine's helper processes would hold a pipe open: output goes through a file.
run() {
  wine "$build/bin/demo/demo_runner.exe" 'C:\Program Files\Quillmark Tools' "$@" > "$prefix/run.out" 2>&1
  tr -d '\r' < "$prefix/run.out"
}

# Each step of the road lives in scripts/demo.d, run in the order of its
# number: 1x-3x install, 4x-6x use, 7x-9x uninstall.
for step in "$here"/scripts/demo.d/*.sh; do
  # shellcheck source=/dev/null
  source "$step"
done
