# shellcheck shell=bash
# Install: platform.xml is rewritten only when it changes (through a staging
# file that replaces it in one step), and no file work follows a link planted
# in a folder the user controls.
section "Maintenance command: enable again; the unchanged platform.xml is not rewritten"
before=$(stat -c '%i %Y' "$config/platform.xml")
run -enablesametime8confige
if [ "$before" = "$(stat -c '%i %Y' "$config/platform.xml")" ]; then
  echo "  platform.xml untouched (same file, same time)"
else
  echo "  platform.xml was rewritten"
fi

section "Maintenance command: per-user copy with a link planted in the Notes data folder"
victim="$c/elsewhere"
mkdir -p "$victim/applications/eclipse/plugins" "$victim/applications/eclipse/features"
mv "$notes/Data/workspace" "$notes/Data/workspace.real"
ln -s "$victim" "$notes/Data/workspace"
echo "  Data\\workspace -> C:\\elsewhere"
run -smsinstallsametimeex
echo "  C:\\elsewhere now holds $(find "$victim" -type f | wc -l) files"
rm "$notes/Data/workspace"
mv "$notes/Data/workspace.real" "$notes/Data/workspace"
rm -rf "$victim"
