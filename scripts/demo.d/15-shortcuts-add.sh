# shellcheck shell=bash
# Install: the suite's shortcuts. An earlier release of the suite (its
# resource libraries name the shortcuts) beside the companion meeting
# application, which Windows Installer registered under one of the suite's
# upgrade codes: the Start-menu shortcuts go into the folder named by the
# suite's texts, the one-click shortcut onto the common desktop.
startmenus=("$c/ProgramData/Microsoft/Windows/Start Menu/Programs"
            "$appdata/Microsoft/Windows/Start Menu/Programs")
desktops=("$c/users/Public/Desktop" "$c/users/$user/Desktop")
shortcuts() {
  for folder in "${startmenus[@]}" "${desktops[@]}"; do
    found=$(cd "$folder" && find . -name '*.lnk' | sed 's|^\./||' | sort)
    [ -n "$found" ] || continue
    echo "  ${folder#"$c/"}:"
    while IFS= read -r link; do echo "    $link"; done <<< "$found"
  done
}

section "Maintenance command: add the shortcuts of an earlier release"
cp "$build/bin/fakes/qmoneclk.exe" "$build/bin/fakes/qminst.exe" "$suite/"
cp "$build/bin/fakes/oldrelease/qmRes.dll" "$build/bin/fakes/oldrelease/qmOI3Res.dll" "$suite/"
reg 'HKLM\SOFTWARE\Mirovan\QmkTools' /v ProductCode /d '{6F1B2C3D-4E5F-4A6B-8C7D-9E0F1A2B3C4D}'
wine reg add 'HKLM\Software\Microsoft\Windows\CurrentVersion\Installer\UpgradeCodes\1A705790D0FBFFE4DBC7B0F099009CD9' \
  /v 39A1EB3B91C93B54EAD80FE3C665084C /d '' /reg:64 /f >/dev/null
wine reg add 'HKLM\SOFTWARE\Microsoft\Windows\CurrentVersion\Uninstall\{B3BE1A93-9C19-45B3-AE8D-F03E6C5680C4}' \
  /v DisplayName /d 'Mirovan Meeting Center' /reg:64 /f >/dev/null
echo "  companion application: Mirovan Meeting Center"
run -addshortcuts
echo "  shortcuts now:"
shortcuts
