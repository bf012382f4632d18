// Owners for the Win32 handles the program opens: kernel objects, registry
// keys, modules, find handles and heap blocks. Each releases on every path.
#pragma once

#include <windows.h>

#include "base/unique_resource.h"

namespace handle_close {
inline void Handle(HANDLE h) {
    ::CloseHandle(h);
}
inline void Key(HKEY h) {
    ::RegCloseKey(h);
}
inline void Module(HMODULE h) {
    ::FreeLibrary(h);
}
inline void Find(HANDLE h) {
    ::FindClose(h);
}
inline void Local(HLOCAL h) {
    ::LocalFree(h);
}
inline void Global(HGLOBAL h) {
    ::GlobalFree(h);
}
inline void Service(SC_HANDLE h) {
    ::CloseServiceHandle(h);
}
}  // namespace handle_close

// Kernel object handles whose failure value is null (processes, tokens, threads).
using UniqueHandle = UniqueResource<NullIsNoneTraits<HANDLE, handle_close::Handle>>;

// Handles whose failure value is INVALID_HANDLE_VALUE (files, snapshots).
struct FileHandleTraits {
    using Type = HANDLE;
    static HANDLE None() noexcept { return INVALID_HANDLE_VALUE; }
    static bool IsValid(HANDLE h) noexcept { return h != INVALID_HANDLE_VALUE && h != nullptr; }
    static void Close(HANDLE h) noexcept { ::CloseHandle(h); }
};
using UniqueFileHandle = UniqueResource<FileHandleTraits>;

struct FindHandleTraits {
    using Type = HANDLE;
    static HANDLE None() noexcept { return INVALID_HANDLE_VALUE; }
    static bool IsValid(HANDLE h) noexcept { return h != INVALID_HANDLE_VALUE && h != nullptr; }
    static void Close(HANDLE h) noexcept { handle_close::Find(h); }
};
using UniqueFindHandle = UniqueResource<FindHandleTraits>;

// Registry keys. Predefined roots (HKEY_LOCAL_MACHINE...) must never be put
// into one; the owner closes whatever it holds.
using UniqueHKey = UniqueResource<NullIsNoneTraits<HKEY, handle_close::Key>>;

using UniqueModule = UniqueResource<NullIsNoneTraits<HMODULE, handle_close::Module>>;
using UniqueLocalMem = UniqueResource<NullIsNoneTraits<HLOCAL, handle_close::Local>>;
using UniqueGlobalMem = UniqueResource<NullIsNoneTraits<HGLOBAL, handle_close::Global>>;
using UniqueServiceHandle = UniqueResource<NullIsNoneTraits<SC_HANDLE, handle_close::Service>>;
