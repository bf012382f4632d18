# shellcheck shell=bash
# Use: a meeting started through the Suite service. The stand-in service
# qmSrv.exe is registered as an out-of-process COM server; it accepts the
# request and reports the meeting's end (event 96) half a second later.
section "Action command: start a meeting through the Suite service"
cp "$build/bin/fakes/qmSrv.exe" "$build/bin/fakes/qmsrv.tlb" "$suite/"
wine "$suite/qmSrv.exe" -RegServer
printf 'Event=StartOCMeeting Meeting 96 500 1\n' > "$suite/qmsrv-script.txt"
export QM_FAKE_QMSRV_SCRIPT="$(winepath -w "$suite/qmsrv-script.txt")"
export QM_FAKE_QMSRV_LOG="$(winepath -w "$suite/qmsrv.log")"
run '<CmdLine><Action>StartOCMeeting</Action><Client>OI</Client><hWnd>1234</hWnd></CmdLine>'
echo "  what the Suite service received and raised:"
# The log holds "<kind> <name> <count>" lines, each followed by its arguments.
awk '/^(call|event) / { kind = $1; name = $2; count = $3; n = 0
                        if (kind == "call") print "    call " name; next }
     count && n < count { n++; sub(/^[0-9]+:/, "")
                          if (kind == "call" && n < count) print "      " $0
                          if (kind == "event" && n == 2) print "    event " name " to a connected sink: " $0 }' \
    "$suite/qmsrv.log"
wine "$suite/qmSrv.exe" -UnregServer
unset QM_FAKE_QMSRV_SCRIPT QM_FAKE_QMSRV_LOG
rm -f "$suite/qmSrv.exe" "$suite/qmsrv.tlb" "$suite/qmsrv-script.txt" "$suite/qmsrv.log"
