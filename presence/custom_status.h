// The meeting presence state for Office Communicator and Lync.
#pragma once

class CMOCCustomStatusInstall {
public:
    CMOCCustomStatusInstall() = default;
    virtual ~CMOCCustomStatusInstall() = default;

    int SilentInstall();
};
