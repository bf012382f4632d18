// CProxyUploadFile: the "UPLOAD_FILE" page, whose island reports the path of
// the uploaded file. The page stays open until it reports success or the user
// closes it.
#pragma once

#include "actions/ie_proxy.h"

class CProxyUploadFile : public CIEProxy {
public:
    explicit CProxyUploadFile(const wchar_t* url) : CIEProxy(url) {}

    int ExaminePage() override;
    void SetFailed(int reason) override;
    void SetSuccess() override;

private:
    CStringEx m_filePath;
};
