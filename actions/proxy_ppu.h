// CProxyPPU: the "PPU" page, whose island reports a conference identifier.
#pragma once

#include "actions/ie_proxy.h"

class CProxyPPU : public CIEProxy {
public:
    explicit CProxyPPU(const wchar_t* url) : CIEProxy(url) {}

    int ExaminePage() override;
    void SetSuccess() override;

private:
    CStringEx m_confId;
};
