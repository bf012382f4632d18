# shellcheck shell=bash
# Use: the Notes plug-in updates itself. The installed program copies the
# updater and itself to temporary names in the plug-in folder and starts the
# copy; the copy's hidden window runs the updater (a stand-in that reports its
# download at once) and the configuration tool (a stand-in that succeeds),
# commits the update and hands over to the installed program, which removes
# the copies and completes the Notes folder from the plug-in folder.
section "Maintenance command: the Notes plug-in updates itself (committed)"
plugin="$suite/NI/Notes"
mkdir -p "$plugin"
for f in lcppn30.dll ndbmrvqm.dll qmnires.dll NIURL.dll qmMRVURL.DLL qmnwintc.dll qmnwinto.dll \
         qmwnictl.dll mirovan.nsf qmniscpt.xml qmniupd.exe mirovanni.chm qmniadpt.dll \
         qmMrvONI.exe qmONIUI.dll qmOI3Res.dll ieqmcodec.dll QCLDLL.dll QCLDLL64.dll \
         QCLProxy.dll QCLProxy64.dll com.mrv.realtime.meeting_1.0.1.jar qmmrvjni.dll \
         msvcp120.dll msvcr120.dll mrvtraceX64.dll; do
  echo "downloaded 2.1 copy of $f" > "$plugin/$f"
done
cp "$build/bin/fakes/qmnwcfg.exe" "$build/bin/fakes/mrvtrace.dll" "$plugin/"
cp "$build/bin/fakes/qmniupd.exe" "$notes/qmniupd.exe"
reg 'HKLM\SOFTWARE\mirovan\NI' /v Path /d 'C:\Program Files (x86)\Quillmark Tools\NI'
reg 'HKCU\Software\Mirovan_Notes\General' /v sitename /d 'demo.mirovan.example'
echo "  plug-in folder C:\\Program Files (x86)\\Quillmark Tools\\NI\\Notes holds the 28 downloaded files"
before=$(listing "$notes")

export QM_FAKE_CALLS_LOG='C:\self-update-calls.log' QM_FAKE_UPDATER=post-wait QM_FAKE_CONFIG_EXIT=0
export QM_DEMO_AWAIT='~MrvONI.exe;qmMrvONI.exe'
# The records of the installed program, its temporary copy and the final run.
run -nupdate
unset QM_FAKE_CALLS_LOG QM_FAKE_UPDATER QM_FAKE_CONFIG_EXIT QM_DEMO_AWAIT
echo "  what the updater and the configuration tool (stand-ins) did:"
grep -v qmusredt "$c/self-update-calls.log" | tr -d '\r' | sed 's/^/    /'
rm -f "$c/self-update-calls.log"
echo "  temporary copies left in the plug-in folder: $(cd "$plugin" && ls -- '~'* 2>/dev/null || echo none)"
echo "  added to the Notes folder from the plug-in folder:"
comm -13 <(echo "$before") <(listing "$notes")
# The downloaded plug-in folder and its settings were this step's own.
rm -rf "$suite/NI"
wine reg delete 'HKLM\SOFTWARE\mirovan\NI' /reg:32 /f >/dev/null
wine reg delete 'HKCU\Software\Mirovan_Notes' /f >/dev/null
