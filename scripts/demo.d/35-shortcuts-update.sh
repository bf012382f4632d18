# shellcheck shell=bash
# Use: the suite's updater runs updateshortcuts. The shortcuts already carry
# this release's names: none is renamed, so the missing ones are added.
section "Maintenance command: update the shortcuts to the current release's names"
run -updateshortcuts
echo "  shortcuts now:"
shortcuts
