# shellcheck shell=bash
# Install: the suite's installer package. msiexec installs the suite's files
# and registry key and runs the program as its custom actions: the Notes and
# Sametime plug-ins and their Eclipse configurations, the smart tag, the
# presence state, the shortcuts and the cleanup of older releases.
section "Installer: install the suite's package (msiexec runs the program as custom actions)"
msiexec /i "$package"
snapshot > "$prefix/machine.installed"
echo "  what changed on the machine:"
changes "$prefix/machine.before" "$prefix/machine.installed"
echo "  shortcuts now:"
shortcuts
echo "  the Sametime profile's platform.xml now:"
sed 's/^/    /' "$config/platform.xml"
