# shellcheck shell=bash
# Install of a later release: its resource libraries name the one-click and
# settings shortcuts anew; the existing ones are renamed and get their icons.
section "Maintenance command: update the shortcuts to the current release's names"
cp "$build/bin/fakes/qmRes.dll" "$build/bin/fakes/qmOI3Res.dll" "$suite/"
run -updateshortcuts
echo "  shortcuts now:"
shortcuts
