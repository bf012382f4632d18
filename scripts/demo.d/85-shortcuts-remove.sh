# shellcheck shell=bash
# Uninstall: the suite's shortcuts, and its Start-menu folders once empty.
section "Maintenance command: remove the shortcuts"
run -delshortcuts
echo "  shortcuts now:"
shortcuts
for folder in "${startmenus[@]}"; do
  if [ -d "$folder/Mirovan Meeting Center" ]; then
    echo "  ${folder#"$c/"}/Mirovan Meeting Center is still there"
  else
    echo "  ${folder#"$c/"}/Mirovan Meeting Center is gone"
  fi
done
