# shellcheck shell=bash
# Uninstall: the Notes plug-in files.
section "Maintenance command: remove the Notes plug-in files"
run -delnifiles
echo "  Notes folder now:"
listing "$notes"
