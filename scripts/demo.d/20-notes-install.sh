# shellcheck shell=bash
# Install: the Notes plug-in files.
section "Maintenance command: copy the Notes plug-in files into Notes"
run -copyfilestonotes
echo "  Notes folder now:"
listing "$notes"
