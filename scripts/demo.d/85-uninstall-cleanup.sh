# shellcheck shell=bash
# Uninstall: the suite's leftovers, every user's settings and the update
# service. The two commands run here directly, so that the users' hives can be
# shown while the program has them loaded; the package's uninstall runs them
# again as its custom actions.
section "Seeding: two more users with the suite's settings, the update service, 64-bit add-ins"
# A user's NTUSER.DAT, written in Wine's own hive format.
user_hive() {
  mkdir -p "$c/users/$1"
  cat > "$c/users/$1/NTUSER.DAT" <<'HIVE'
WINE REGISTRY Version 2

[SOFTWARE\\Mirovan\\QmkTools] 1700000000
"QMUILanguage"="en-US"

[SOFTWARE\\Mirovan\\QmkTools\\Meeting] 1700000000
"LastServer"="meet.example.com"

[SOFTWARE\\Mirovan\\Recorder] 1700000000
"Keep"="another program's settings"
HIVE
}
user_hive alice
user_hive bob
wine reg add 'HKCU\SOFTWARE\Mirovan\QmkTools' /v QMUILanguage /d en-US /f >/dev/null
mkdir -p "$suite/upd_temp/components"
touch "$suite/upd_temp/a_upd_temp" "$suite/upd_temp/components/b_upd_temp"
for f in qmolkadd64.dll qmMrvst64.dll; do cp "$build/bin/fakes/addin64.dll" "$suite/$f"; done
service="$c/ProgramData/Quillmark"
mkdir -p "$service"
cp "$build/bin/fakes/mirovan_service.exe" "$service/"
wine sc create MirovanService binpath= \
  'C:\ProgramData\Quillmark\mirovan_service.exe C:\ProgramData\Quillmark\service.log 1000 2' >/dev/null
wine sc start MirovanService >/dev/null
echo "  users: $(cd "$c/users" && ls -d alice bob | tr '\n' ' ')each with SOFTWARE\\Mirovan\\QmkTools"
echo "  update service MirovanService: $(wine sc query MirovanService | tr -d '\r' | sed -n 's/.*STATE *: [0-9]* *//p')"
echo "  suite folder's add-ins and update leftovers:"
(cd "$suite" && find upd_temp qmolkadd64.dll qmMrvst64.dll -type f | sort | sed 's/^/    /')

section "Maintenance commands: remove the suite's files and service, then every user's settings"
export QM_FAKE_CALLS_LOG='C:\ProgramData\Quillmark\calls.log' QM_DEMO_WATCH_HIVES='alice;bob'
run -delallqmfiles -delunuseddata
unset QM_FAKE_CALLS_LOG QM_DEMO_WATCH_HIVES
echo "  Notes folder now (the plug-in files went with -delnifiles before):"
listing "$notes"
echo "  64-bit add-ins unregistered through the 64-bit regsvr32:"
tr -d '\r' < "$service/calls.log" | grep DllUnregisterServer | sed 's/ in .* by / by /; s/^/    /'
if [ -d "$suite/upd_temp" ]; then
  echo "  suite folder's update leftovers now:"
  listing "$suite/upd_temp"
else
  echo "  suite folder's update leftovers: gone, upd_temp with them"
fi
if wine sc query MirovanService >/dev/null 2>&1; then state="still installed"; else state="gone"; fi
echo "  update service MirovanService: $state (it logged: $(tr -d '\r' < "$service/service.log" | paste -sd, -))"
if wine reg query 'HKCU\SOFTWARE\Mirovan\QmkTools' >/dev/null 2>&1; then
  echo "  this account's SOFTWARE\\Mirovan\\QmkTools: still there"
else
  echo "  this account's SOFTWARE\\Mirovan\\QmkTools: gone"
fi
# The 64-bit add-ins were this step's own (the package does not carry them).
rm -f "$suite/qmolkadd64.dll" "$suite/qmMrvst64.dll"
