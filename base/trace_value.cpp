#include "base/trace_value.h"

#include <cstdio>

#include "base/ansi_text.h"
#include "base/string_ex.h"

namespace {

std::string Printed(const char* format, ...) __attribute__((format(ms_printf, 1, 2)));

std::string Printed(const char* format, ...) {
    char buffer[64];
    va_list args;
    va_start(args, format);
    int length = _vsnprintf(buffer, sizeof(buffer) - 1, format, args);
    va_end(args);
    if (length < 0) {
        length = 0;
    }
    buffer[length] = '\0';
    return std::string(buffer, static_cast<size_t>(length));
}

}  // namespace

CVarAdapter::CVarAdapter(const char* text) : m_text(text ? text : "") {}
CVarAdapter::CVarAdapter(const std::string& text) : m_text(text) {}
CVarAdapter::CVarAdapter(const wchar_t* text) : m_text(WideToAnsi(text)) {}
CVarAdapter::CVarAdapter(const CStringEx& text) : m_text(WideToAnsi(text.c_str())) {}
CVarAdapter::CVarAdapter(bool value) : m_text(value ? "TRUE" : "FALSE") {}
CVarAdapter::CVarAdapter(char value) : m_text(1, value) {}
CVarAdapter::CVarAdapter(int value) : m_text(Printed("%d", value)) {}
CVarAdapter::CVarAdapter(unsigned int value) : m_text(Printed("%u", value)) {}
CVarAdapter::CVarAdapter(long value) : m_text(Printed("%ld", value)) {}
CVarAdapter::CVarAdapter(unsigned long value) : m_text(Printed("%lu", value)) {}
CVarAdapter::CVarAdapter(long long value) : m_text(Printed("%I64d", value)) {}
CVarAdapter::CVarAdapter(unsigned long long value) : m_text(Printed("%I64u", value)) {}
CVarAdapter::CVarAdapter(double value) : m_text(Printed("%g", value)) {}
CVarAdapter::CVarAdapter(const void* pointer)
    : m_text(Printed("0x%08X", static_cast<unsigned>(reinterpret_cast<UINT_PTR>(pointer)))) {}
CVarAdapter::CVarAdapter(const GUID& guid)
    : m_text(Printed("%08lX-%04X-%04X-%02X%02X-%02X%02X%02X%02X%02X%02X", guid.Data1, guid.Data2,
                     guid.Data3, guid.Data4[0], guid.Data4[1], guid.Data4[2], guid.Data4[3],
                     guid.Data4[4], guid.Data4[5], guid.Data4[6], guid.Data4[7])) {}
CVarAdapter::~CVarAdapter() = default;
