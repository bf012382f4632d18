// Values and parameters of trace records.
#pragma once

#include <windows.h>

#include <string>

class CStringEx;

// The text form of one traced value, held as a narrow string.
class CVarAdapter {
public:
    CVarAdapter(const char* text);
    CVarAdapter(const std::string& text);
    CVarAdapter(const wchar_t* text);  // converted to the ANSI code page
    CVarAdapter(const CStringEx& text);
    CVarAdapter(bool value);
    CVarAdapter(char value);
    CVarAdapter(int value);
    CVarAdapter(unsigned int value);
    CVarAdapter(long value);
    CVarAdapter(unsigned long value);
    CVarAdapter(long long value);
    CVarAdapter(unsigned long long value);
    CVarAdapter(double value);
    CVarAdapter(const void* pointer);  // "0x" and eight upper-case hex digits
    CVarAdapter(const GUID& guid);
    virtual ~CVarAdapter();

    const std::string& Text() const { return m_text; }

private:
    std::string m_text;
};

// One parameter of a record: an optional name and an optional value. Build it
// inside the logging call's argument list: it points at a temporary value.
struct TraceParam {
    const char* name;
    const CVarAdapter* value;
};

inline TraceParam TraceValue(const CVarAdapter& value) {
    return TraceParam{nullptr, &value};
}
inline TraceParam TraceNamed(const char* name, const CVarAdapter& value) {
    return TraceParam{name, &value};
}
inline TraceParam TraceNameOnly(const char* name) {
    return TraceParam{name, nullptr};
}
