// The meeting presence state for Office Communicator and Lync 2013: one custom
// state, "In a Mirovan meeting", in the status file that the policy value
// "CustomStateURL" names. Either the suite's own status file is installed and
// the policy pointed at it, or the state is added to the file an
// administrator configured. The operations keep no state: all are static.
#pragma once

#include <windows.h>

#include "base/com_owners.h"
#include "base/string_ex.h"

class CMOCCustomStatusInstall {
public:
    // 1 when it installed or updated something, else the result of the last
    // update of a configured file.
    static int SilentInstall();

    // Makes sure the file a configured "file" URL names exists: a missing
    // "Quillmark Tools" folder (and "Mirovan" above it) is created, no folder
    // of another name, and the template is copied there.
    static void ValidateCustomStatusFile(const wchar_t* lpszUrl);
    // Adds the suite's state to the file a configured "file" URL names; 1
    // when the file was saved with it, 0 when it already held it or could
    // not be read, changed or saved (the file is then as it was).
    static int UpdateStatusFileForInstall(const wchar_t* lpszUrl);

    // Appends a copy of the template's state to the document's root element;
    // 1 on success.
    static int InsertMirovanStatus(IUnknown* pDom);
    // The document's customState element with the ID 19780803 and an
    // activity LCID 1033 "In a Mirovan meeting", or null.
    static ComPtr<IUnknown> GetMirovanStatusNode(IUnknown* pDom);
    // Removes the comments earlier releases left at the top of the file and,
    // when one was removed and a path is given, saves the document there.
    static void RemoveMrvOldCommNode(IUnknown* pDom, const wchar_t* lpszPath);

    // name in "<all users' application data>\Mirovan\Quillmark Tools" and in
    // the same folders of the user's roaming application data; the folders
    // are created.
    static bool GetAllUserAppDataMrvQMFilePath(const wchar_t* name, CStringEx& out);
    static bool GetAppDataMrvQMPath(const wchar_t* name, CStringEx& out);
};
