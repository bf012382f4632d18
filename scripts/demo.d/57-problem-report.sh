# shellcheck shell=bash
# Use: the user reports a problem; the trace files in the temporary folder are
# zipped and a new mail is opened through Simple MAPI (here the MAPI stand-in,
# which records the mail it is given).
section "Action command: send a problem report through Simple MAPI"
cp "$build/bin/fakes/qmocres.dll" "$build/bin/fakes/MAPI32.DLL" "$build/bin/fakes/qmONIUI.dll" \
   "$suite/"
# The program loads the MAPI32.DLL beside it instead of Wine's own.
wine reg add 'HKCU\Software\Wine\AppDefaults\qmMrvONI.exe\DllOverrides' /v mapi32 \
     /d native,builtin /f >/dev/null
temp="$c/users/$user/Temp"
mkdir -p "$temp"
for day in 1 2; do
  for i in $(seq 1 200); do
    echo "2024-05-0$day 10:00:$((i % 60)) [QM] level 2 --> CMeeting::Join step $i"
  done > "$temp/mrv_2024050$day.mvt"
done
echo "  trace files in C:\\users\\$user\\Temp:"
listing "$temp"
calls="$prefix/drive_c/mapi-calls.log"
QM_FAKE_CALLS_LOG='C:\mapi-calls.log' run '<CmdLine><Action>SendProblemReport</Action></CmdLine>'
echo "  the mail MAPI was given:"
grep -v '^qmusredt' "$calls" | sed 's/^/    /'
echo "  entries of Mirovan_Trace.zip:"
unzip -l "$temp/Mirovan_Trace.zip" | sed 's/^/    /'
rm -f "$calls" "$temp"/*.mvt "$temp/Mirovan_Trace.zip" "$suite/qmocres.dll" "$suite/MAPI32.DLL"
