// Typed lookup of a library export.
#pragma once

#include <windows.h>

// The export `name` of module as a function pointer of type Fn, or null.
template <typename Fn>
Fn GetProcAs(HMODULE module, const char* name) {
    if (module == nullptr) {
        return nullptr;
    }
    return reinterpret_cast<Fn>(reinterpret_cast<void*>(GetProcAddress(module, name)));
}
