// Move-only owner of one platform resource (handle, key, module, memory block).
// The traits name the "none" value and how the resource is released.
#pragma once

#include <utility>

template <typename Traits>
class UniqueResource {
public:
    using value_type = typename Traits::Type;

    UniqueResource() noexcept : m_value(Traits::None()) {}
    explicit UniqueResource(value_type value) noexcept : m_value(value) {}
    ~UniqueResource() { reset(); }

    UniqueResource(const UniqueResource&) = delete;
    UniqueResource& operator=(const UniqueResource&) = delete;
    UniqueResource(UniqueResource&& other) noexcept : m_value(other.release()) {}
    UniqueResource& operator=(UniqueResource&& other) noexcept {
        if (this != &other) {
            reset(other.release());
        }
        return *this;
    }

    value_type get() const noexcept { return m_value; }
    bool valid() const noexcept { return Traits::IsValid(m_value); }
    explicit operator bool() const noexcept { return valid(); }

    void reset(value_type value = Traits::None()) noexcept {
        value_type old = m_value;
        m_value = value;
        if (Traits::IsValid(old)) {
            Traits::Close(old);
        }
    }

    value_type release() noexcept {
        value_type old = m_value;
        m_value = Traits::None();
        return old;
    }

    // Releases what is held and returns the address for a function that fills it.
    value_type* put() noexcept {
        reset();
        return &m_value;
    }

private:
    value_type m_value;
};

// Traits for resources whose "none" value is a null pointer.
template <typename T, void (*CloseFn)(T)>
struct NullIsNoneTraits {
    using Type = T;
    static T None() noexcept { return nullptr; }
    static bool IsValid(T value) noexcept { return value != nullptr; }
    static void Close(T value) noexcept { CloseFn(value); }
};
