#include "actions/proxy_ppu.h"

#include "actions/island_result.h"
#include "actions/page_island.h"

int CProxyPPU::ExaminePage() {
    if (!m_confId.IsEmpty()) {
        return 1;
    }
    CStringEx text;
    if (!ReadPageIsland(Browser(), true, text)) {
        return 0;
    }
    // The page has given its answer: the browser goes at once, whatever the
    // answer is.
    QuitBrowser();
    COIXML island;
    island.SetXML(text.c_str());
    if (!IslandReportsSuccess(island)) {
        return 0;
    }
    m_confId = IslandField(island, L"CD", L"cd");
    return 1;
}

void CProxyPPU::SetSuccess() {
    COIXML& feedback = NewFeedback(L"Success");
    if (!m_confId.IsEmpty()) {
        feedback.AddChild(L"ConfID", m_confId.c_str(), true);
    }
}
