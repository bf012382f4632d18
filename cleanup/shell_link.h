// Shortcut files through the shell link object (IShellLinkW, saved and
// loaded through IPersistFile). COM must be initialised on the thread.
#pragma once

#include <windows.h>
#include <shobjidl.h>

#include "base/com_owners.h"
#include "base/string_ex.h"

// What a shortcut file says.
struct LinkFields {
    CStringEx target;  // the short form where the system gives one
    CStringEx workingDir;
    CStringEx arguments;
    CStringEx iconPath;
    int iconIndex = 0;
};

// One shell link object, empty or loaded from a file.
class ShellLinkFile {
public:
    ShellLinkFile();  // creates the object; Created() tells whether that worked
    bool Created() const { return m_link != nullptr; }
    IShellLinkW* Link() const { return m_link.Get(); }

    // Loads the file (read mode) and resolves it without any user interface.
    HRESULT Load(HWND owner, const wchar_t* linkPath);
    // The fields of the loaded link. Fails when its target cannot be read or
    // is too long for a path.
    HRESULT Read(LinkFields& out) const;
    // Saves to linkPath and makes it the object's file.
    HRESULT Save(const wchar_t* linkPath);

private:
    ComPtr<IShellLinkW> m_link;
};

// Creates the shortcut linkPath to target. Folder, target, link path and
// working directory must be given, else E_FAIL; the icon and the arguments
// only when given. The result of the save.
HRESULT CreateLink(HWND owner, const wchar_t* folder, const wchar_t* target,
                   const wchar_t* linkPath, const wchar_t* arguments, const wchar_t* iconPath,
                   int iconIndex, const wchar_t* workingDir);

// Reads the shortcut at linkPath.
HRESULT ReadLink(HWND owner, const wchar_t* linkPath, LinkFields& out);
