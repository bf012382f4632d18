// One-click items: Actions carried out by the suite's one-click library.
#pragma once

#include "actions/command_info.h"
#include "base/string_ex.h"

class COneClickItemHandler {
public:
    // browserName may be null.
    explicit COneClickItemHandler(const wchar_t* browserName);
    virtual ~COneClickItemHandler() = default;

    // 1 when a method of the one-click object was called, else 0.
    int Handle(CommandInfo& commandInfo);

private:
    CStringEx m_browserName;
};
