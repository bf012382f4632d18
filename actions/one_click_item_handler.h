// One-click items: Actions carried out by the suite's one-click library
// qmMrvMS.DLL, loaded from the program's folder without the registry.
#pragma once

#include <windows.h>

#include "actions/command_info.h"
#include "actions/one_click_items.h"
#include "base/com_owners.h"
#include "base/string_ex.h"
#include "base/win_handles.h"

class COneClickItemHandler {
public:
    // browserName may be null; "Firefox" for the Firefox client.
    explicit COneClickItemHandler(const wchar_t* browserName);
    virtual ~COneClickItemHandler();
    COneClickItemHandler(const COneClickItemHandler&) = delete;
    COneClickItemHandler& operator=(const COneClickItemHandler&) = delete;

    // 1 when a method of the one-click object was called, else 0.
    int Handle(CommandInfo& commandInfo);

private:
    // 1 when the object is held (created now or before), else 0.
    int CreateOneClickObject();
    void FreeOneClickObject();
    // Calls the method of the Action; false when the Action has none.
    bool CallActionMethod(int nAction);

    // The library is declared first so that it is freed after the object.
    UniqueModule m_module;
    ComPtr<IOneClickItems> m_spOneClickItems;
    CStringEx m_browserName;
};

// The top-level window under the mouse cursor: the window there, then its
// parents up to the last one; null when no window lies under the cursor.
HWND OwnerWindowUnderCursor();
