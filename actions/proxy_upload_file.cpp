#include "actions/proxy_upload_file.h"

#include "actions/island_result.h"
#include "actions/page_island.h"

int CProxyUploadFile::ExaminePage() {
    if (!m_filePath.IsEmpty()) {
        return 1;
    }
    CStringEx text;
    if (!ReadPageIsland(Browser(), false, text)) {
        return 0;
    }
    COIXML island;
    island.SetXML(text.c_str());
    if (!IslandReportsSuccess(island)) {
        return 0;
    }
    // The page's "Reason" carries nothing the caller is told.
    m_filePath = UploadedFileName(island);
    return 1;
}

void CProxyUploadFile::SetFailed(int reason) {
    CIEProxy::SetFailed(reason);
}

void CProxyUploadFile::SetSuccess() {
    COIXML& feedback = NewFeedback(L"Success");
    if (!m_filePath.IsEmpty()) {
        feedback.AddChild(L"FileName", m_filePath.c_str(), true);
    }
}
