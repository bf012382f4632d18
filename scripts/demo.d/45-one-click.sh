# shellcheck shell=bash
# Use: a one-click Action carried out by the suite's one-click library.
section "One-click Action: join a meeting through the one-click library qmMrvMS.DLL"
cp "$build/bin/fakes/qmMrvMS.DLL" "$suite/"
export QM_FAKE_CALLS_LOG='C:\demo-calls.log'
run '<CmdLine><Action>JoinMeeting</Action><hWnd>0</hWnd></CmdLine>'
echo "  the one-click library received (only the desktop lies under the mouse cursor here):"
grep -v '^qmusredt' "$c/demo-calls.log" | tr -d '\r' | sed 's/^/    /'
rm -f "$c/demo-calls.log" "$suite/qmMrvMS.DLL"
unset QM_FAKE_CALLS_LOG
