// Owners of what crosses COM calls: interface pointers (WRL's ComPtr), BSTRs,
// COM-allocated memory and VARIANTs.
#pragma once

#include <windows.h>
#include <objbase.h>
#include <oleauto.h>
#include <wrl/client.h>

#include "base/unique_resource.h"

using Microsoft::WRL::ComPtr;

namespace com_free {
inline void Bstr(BSTR s) {
    ::SysFreeString(s);
}
inline void TaskMem(void* p) {
    ::CoTaskMemFree(p);
}
inline void SafeArray(SAFEARRAY* array) {
    ::SafeArrayDestroy(array);
}
}  // namespace com_free

using UniqueBstr = UniqueResource<NullIsNoneTraits<BSTR, com_free::Bstr>>;
using UniqueCoTaskMem = UniqueResource<NullIsNoneTraits<void*, com_free::TaskMem>>;
using UniqueSafeArray = UniqueResource<NullIsNoneTraits<SAFEARRAY*, com_free::SafeArray>>;

// Owns a VARIANT and clears it on every path.
class UniqueVariant {
public:
    UniqueVariant() noexcept { ::VariantInit(&m_var); }
    ~UniqueVariant() { ::VariantClear(&m_var); }
    UniqueVariant(const UniqueVariant&) = delete;
    UniqueVariant& operator=(const UniqueVariant&) = delete;

    VARIANT* get() noexcept { return &m_var; }
    const VARIANT& ref() const noexcept { return m_var; }

private:
    VARIANT m_var;
};
