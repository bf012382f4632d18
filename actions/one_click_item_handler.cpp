#include "actions/one_click_item_handler.h"

COneClickItemHandler::COneClickItemHandler(const wchar_t* browserName)
    : m_browserName(browserName) {}

// The one-click library is reached with the one-click work; until then no
// object can be created and the result is 0.
int COneClickItemHandler::Handle(CommandInfo& /*commandInfo*/) {
    return 0;
}
