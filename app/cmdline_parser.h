// CCmdLineParser: turns an Action command ("<CmdLine>...</CmdLine>") into one
// CommandInfo record.
#pragma once

#include "actions/command_info.h"
#include "base/string_ex.h"

class CCmdLineParser {
public:
    CCmdLineParser() = default;
    virtual ~CCmdLineParser() = default;

    // 1 when text holds a "CmdLine" root with a known Action, else 0.
    int Parse(const CStringEx& text);
    // 0 when no Action was recognised; otherwise copies the record and gives 1.
    int GetCommandInfo(CommandInfo& out) const;

private:
    CommandInfo m_sCommandInfo;
};

// The Action number of an Action name (exact, case-sensitive), 0 when unknown.
int ActionNumberFromName(const wchar_t* name);
