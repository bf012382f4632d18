# shellcheck shell=bash
# Install: the meeting presence state for Office Communicator. The package
# installs the suite's template MirovanStatus.xml and its mocvistainstall
# action pointed the policy at the all-users status file; where an
# administrator configured a file of their own, mocvistainstall adds the
# suite's state to it once.
section "Presence state: what the installer's mocvistainstall set"
policy='HKLM\Software\Policies\Microsoft\Communicator'
policy_values() {
  echo "  $policy $1:"
  wine reg query "$policy" /reg:32 2>/dev/null | tr -d '\r' | grep REG_ | sed 's/^ */    /' ||
    echo "    (no values)"
}
one_element_a_line() { sed 's/></>\n</g' "$1" | sed 's/^/    /'; }
policy_values "after the install"
echo "  C:\\ProgramData\\Mirovan\\Quillmark Tools\\status.xml, copied from the template:"
one_element_a_line "$c/ProgramData/Mirovan/Quillmark Tools/status.xml"

section "Maintenance command: an administrator's status file gains the suite's state once"
installed_url=$(wine reg query "$policy" /v CustomStateURL /reg:32 | tr -d '\r' |
                sed -n 's/^ *CustomStateURL *REG_SZ *//p')
mkdir -p "$c/Policies"
cat > "$c/Policies/status.xml" <<'XML'
<?xml version="1.0" encoding="UTF-8"?>
<customStates xmlns="http://schemas.microsoft.com/09/2005/communicator/customStates">
<customState ID="19780803" availability="busy"><activity LCID="1033">In einer Mirovan-Besprechung</activity></customState>
</customStates>
XML
wine reg add "$policy" /v CustomStateURL /d 'file:///C:/Policies/status.xml' /reg:32 /f >/dev/null
policy_values now
run -mocvistainstall
before=$(stat -c '%Y %s' "$c/Policies/status.xml")
run -mocvistainstall
echo "  C:\\Policies\\status.xml (the second run left it as it was: $(
  [ "$before" = "$(stat -c '%Y %s' "$c/Policies/status.xml")" ] && echo yes || echo no)):"
one_element_a_line "$c/Policies/status.xml"
# The administrator's file was this step's own: the policy the install set again.
wine reg add "$policy" /v CustomStateURL /d "$installed_url" /reg:32 /f >/dev/null
rm -rf "$c/Policies"
