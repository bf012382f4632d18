// Reference-counted owner of one COM interface pointer, and owners for the
// COM-allocated memory and strings that cross COM calls.
#pragma once

#include <windows.h>
#include <objbase.h>
#include <oleauto.h>

#include "base/unique_resource.h"

template <typename T>
class ComPtr {
public:
    ComPtr() noexcept = default;
    ComPtr(const ComPtr& other) noexcept : m_ptr(other.m_ptr) { AddRef(); }
    ComPtr(ComPtr&& other) noexcept : m_ptr(other.m_ptr) { other.m_ptr = nullptr; }
    ~ComPtr() { Release(); }

    ComPtr& operator=(const ComPtr& other) noexcept {
        if (m_ptr != other.m_ptr) {
            ComPtr(other).Swap(*this);
        }
        return *this;
    }
    ComPtr& operator=(ComPtr&& other) noexcept {
        ComPtr(static_cast<ComPtr&&>(other)).Swap(*this);
        return *this;
    }

    T* get() const noexcept { return m_ptr; }
    T* operator->() const noexcept { return m_ptr; }
    explicit operator bool() const noexcept { return m_ptr != nullptr; }

    // Releases what is held and returns the address for an out-parameter.
    T** put() noexcept {
        Release();
        return &m_ptr;
    }
    void** put_void() noexcept { return reinterpret_cast<void**>(put()); }

    void reset() noexcept { Release(); }

    // Takes over a reference the caller already owns.
    void attach(T* ptr) noexcept {
        Release();
        m_ptr = ptr;
    }

    template <typename U>
    HRESULT QueryTo(ComPtr<U>* out) const noexcept {
        if (m_ptr == nullptr) {
            return E_POINTER;
        }
        return m_ptr->QueryInterface(__uuidof(U), out->put_void());
    }

private:
    void AddRef() noexcept {
        if (m_ptr) {
            m_ptr->AddRef();
        }
    }
    void Release() noexcept {
        T* old = m_ptr;
        m_ptr = nullptr;
        if (old) {
            old->Release();
        }
    }
    void Swap(ComPtr& other) noexcept {
        T* tmp = m_ptr;
        m_ptr = other.m_ptr;
        other.m_ptr = tmp;
    }

    T* m_ptr = nullptr;
};

namespace com_free {
inline void Bstr(BSTR s) {
    ::SysFreeString(s);
}
inline void TaskMem(void* p) {
    ::CoTaskMemFree(p);
}
}  // namespace com_free

using UniqueBstr = UniqueResource<NullIsNoneTraits<BSTR, com_free::Bstr>>;
using UniqueCoTaskMem = UniqueResource<NullIsNoneTraits<void*, com_free::TaskMem>>;

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
