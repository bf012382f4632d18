// Where Lotus Notes and the suite's Notes plug-in are: the Notes program and
// data folders, the Notes version, the plug-in's own folder, and the
// multi-user and Citrix facts that decide where the embedded Sametime lives.
#include <shlwapi.h>
#include <stdlib.h>

#include "base/registry.h"
#include "base/trace.h"
#include "base/user_profile.h"
#include "notes/location_values.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"

namespace {

const wchar_t kNIKey[] = L"SOFTWARE\\mirovan\\NI";
const wchar_t kCitrixKey[] = L"SOFTWARE\\Citrix\\Citrix Management Console";
const wchar_t kNotesFolderName[] = L"Notes";
const DWORD kVersionTextChars = MAX_PATH;

// The first Notes key under root whose folder value `name` fits the buffer
// and is a full path. A relative value would make the callers act in the
// working folder (under an installer, the system folder): it counts as absent.
bool ReadFirstNotesFolder(HKEY root, const wchar_t* name, wchar_t* buffer, DWORD capacity) {
    for (const wchar_t* key : kNotesKeys) {
        if (ReadFittingValue(root, key, name, KEY_QUERY_VALUE, buffer, capacity) &&
            IsFullFolderPath(buffer)) {
            return true;
        }
    }
    ClearLocation(buffer, capacity);
    return false;
}

bool IsSeparator(wchar_t ch) {
    return ch == L'\\' || ch == L'/';
}

// True when the last component of path is "Notes" (any case). A trailing
// separator does not make the last component a different one.
bool EndsWithNotesFolder(const wchar_t* path) {
    size_t end = wcslen(path);
    while (end > 0 && IsSeparator(path[end - 1])) {
        --end;
    }
    size_t start = end;
    while (start > 0 && !IsSeparator(path[start - 1]) && path[start - 1] != L':') {
        --start;
    }
    const size_t nameChars = wcslen(kNotesFolderName);
    return end - start == nameChars &&
           CompareStringW(LOCALE_USER_DEFAULT, NORM_IGNORECASE, path + start,
                          static_cast<int>(nameChars), kNotesFolderName,
                          static_cast<int>(nameChars)) == CSTR_EQUAL;
}

// Appends "\Notes" unless the path already ends in that folder. A result that
// would not fit the buffer fails and clears it.
bool AppendNotesFolder(wchar_t* path, DWORD capacity) {
    if (EndsWithNotesFolder(path)) {
        return true;
    }
    size_t length = wcslen(path);
    bool needsSeparator = length > 0 && !IsSeparator(path[length - 1]);
    size_t total = length + (needsSeparator ? 1 : 0) + wcslen(kNotesFolderName);
    if (total >= capacity) {
        ClearLocation(path, capacity);
        return false;
    }
    if (needsSeparator) {
        path[length++] = L'\\';
    }
    wcscpy(path + length, kNotesFolderName);
    return true;
}

// The plug-in folder named by root\SOFTWARE\mirovan\NI "Path".
bool ReadNIPath(HKEY root, wchar_t* lpszPath, DWORD capacity) {
    return ReadFittingValue(root, kNIKey, L"Path", KEY_QUERY_VALUE, lpszPath, capacity) &&
           AppendNotesFolder(lpszPath, capacity);
}

}  // namespace

bool GetNotesPath(wchar_t* lpszPath, DWORD capacity) {
    if (lpszPath == nullptr) {
        return false;
    }
    return ReadFirstNotesFolder(HKEY_LOCAL_MACHINE, L"Path", lpszPath, capacity);
}

DWORD GetNotesVersion() {
    if (CanOpenKey(HKEY_LOCAL_MACHINE, kNotesKeys[0])) {
        return 6;
    }
    if (CanOpenKey(HKEY_LOCAL_MACHINE, kNotesKeys[1])) {
        return 7;
    }
    if (CanOpenKey(HKEY_LOCAL_MACHINE, kNotesKeys[2])) {
        return 8;
    }
    if (!CanOpenKey(HKEY_LOCAL_MACHINE, kNotesKeys[3])) {
        return 6;
    }
    // Notes 9 and later keep only the unversioned key, with "Version" such as
    // "90001" (major 9, release 0.0.1).
    wchar_t version[kVersionTextChars] = {};
    ReadFittingValue(HKEY_LOCAL_MACHINE, kNotesKeys[3], L"Version", KEY_QUERY_VALUE, version,
                     kVersionTextChars);
    unsigned long number = static_cast<unsigned long>(_wtol(version));
    return number >= 90000 ? 9 : 6;
}

bool GetNIPath(wchar_t* lpszPath, DWORD capacity) {
    if (lpszPath == nullptr) {
        return false;
    }
    return ReadNIPath(HKEY_LOCAL_MACHINE, lpszPath, capacity);
}

bool GetNIPathAnyUser(wchar_t* lpszPath, DWORD capacity) {
    if (lpszPath == nullptr) {
        return false;
    }
    HKEY root = CanOpenKey(HKEY_LOCAL_MACHINE, kNIKey) ? HKEY_LOCAL_MACHINE : HKEY_CURRENT_USER;
    return ReadNIPath(root, lpszPath, capacity);
}

bool GetNotesMultiUser(DWORD* value) {
    if (value == nullptr) {
        return false;
    }
    for (const wchar_t* key : kNotesKeys) {
        if (ReadFourByteValue(HKEY_LOCAL_MACHINE, key, L"MultiUser", value)) {
            return true;
        }
    }
    return false;
}

bool IsCitrixServer() {
    return CanOpenKey(HKEY_LOCAL_MACHINE, kCitrixKey);
}

bool GetEmbeddedSTPath(wchar_t* lpszPath, DWORD capacity, DWORD* version) {
    if (lpszPath == nullptr) {
        return false;
    }
    DWORD notesVersion = GetNotesVersion();
    if (version != nullptr) {
        *version = notesVersion;
    }
    if (notesVersion < 8) {
        ClearLocation(lpszPath, capacity);
        return false;
    }
    return GetNotesPath(lpszPath, capacity);
}

bool GetEmbeddedSTDataPath(wchar_t* lpszPath, DWORD capacity, DWORD* version) {
    if (lpszPath == nullptr) {
        return false;
    }
    ClearLocation(lpszPath, capacity);
    DWORD notesVersion = GetNotesVersion();
    if (version != nullptr) {
        *version = notesVersion;
    }
    if (notesVersion < 8) {
        return false;
    }

    DWORD multiUser = 0;
    if (GetNotesMultiUser(&multiUser) && multiUser != 0) {
        TraceLevel1(TraceValue("GetEmbeddedSTDataPath() MultiUser Mode."));
        HKEY userRoot = GetUserRegRoot();
        if (userRoot == nullptr) {
            userRoot = HKEY_CURRENT_USER;
        }
        for (const wchar_t* key : kNotesKeys) {
            if (GetRegString(userRoot, key, L"NotesIniPath", lpszPath, capacity, 0)) {
                // The data folder is the one that holds notes.ini.
                PathRemoveFileSpecW(lpszPath);
                if (IsFullFolderPath(lpszPath)) {
                    return true;
                }
            }
        }
        ClearLocation(lpszPath, capacity);
        return false;
    }

    TraceLevel1(TraceValue("GetEmbeddedSTDataPath() Not MultiUser Mode."));
    if (IsCitrixServer()) {
        return false;
    }
    TraceLevel1(TraceValue("Lotus Notes is NOT installed on Citrix Server"));
    return ReadFirstNotesFolder(HKEY_LOCAL_MACHINE, L"DataPath", lpszPath, capacity);
}
