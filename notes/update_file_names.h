// The files of the Notes plug-in's self-update: the two programs it starts
// from the Notes folder and the temporary copies it runs them as.
#pragma once

// In the Notes program folder.
constexpr wchar_t kUpdaterFileName[] = L"qmniupd.exe";
constexpr wchar_t kInstalledProgramFileName[] = L"qmMrvONI.exe";
// In the plug-in folder.
constexpr wchar_t kTemporaryUpdaterFileName[] = L"~TmpDown.exe";
constexpr wchar_t kTemporaryProgramFileName[] = L"~MrvONI.exe";
constexpr wchar_t kConfigToolFileName[] = L"qmnwcfg.exe";
