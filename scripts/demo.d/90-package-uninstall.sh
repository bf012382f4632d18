# shellcheck shell=bash
# Uninstall: the suite's package again. The custom actions run the copy of the
# program the package keeps under the common application data, before the
# suite's files and key are removed.
section "Installer: uninstall the suite's package"
msiexec /x "$product"
snapshot > "$prefix/machine.after"
echo "  what the road left on the machine, against the machine before the install:"
changes "$prefix/machine.before" "$prefix/machine.after"
cat <<'TEXT'
  left on purpose:
    - the Eclipse configuration stamps are gone (renamed on install, their
      backups dropped by the next reset): Eclipse rebuilds its configuration
      at its next start; each platform.xml holds the same elements, written
      without the white space between them;
    - the C runtime beside Sametime (rcp\msvcp120.dll, rcp\msvcr120.dll): the
      removal deletes only the older runtime's names;
    - the earlier release's qmnires.dll in Notes goes with the plug-in;
    - the presence state: the Communicator policy and its status file stay,
      nothing removes them;
    - the smart-tag action's parent key, Office's own.
TEXT
