// Mail through Simple MAPI: a new message with the report's texts and
// attachments, shown to the user to address and send.
#pragma once

#include <windows.h>
#include <mapi.h>

#include <string>

#include "actions/report_info.h"
#include "base/win_handles.h"

class CSimpleMapi {
public:
    CSimpleMapi() = default;
    virtual ~CSimpleMapi() = default;
    CSimpleMapi(const CSimpleMapi&) = delete;
    CSimpleMapi& operator=(const CSimpleMapi&) = delete;

    // Loads "MAPI32.DLL" and finds "MAPISendMail".
    void Init();
    // Opens the new message; 1 when MAPI took it (sent, or closed by the
    // user), 0 when MAPI is missing or failed.
    BOOL Send(const CRptInfo& report);
    void DeInit();

    // path in the ANSI code page; when it has characters outside it, its
    // short form if that has none, so MAPI still finds the file.
    static std::string AnsiPathForMapi(const wchar_t* path);

private:
    UniqueModule m_module;
    LPMAPISENDMAIL m_sendMail = nullptr;
    BOOL m_initialized = FALSE;
};
