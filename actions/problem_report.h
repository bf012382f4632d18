// The problem report: "SendProblemReport" zips the trace files and mails them.
#pragma once

class CSendProblemReport {
public:
    CSendProblemReport() = default;
    virtual ~CSendProblemReport() = default;

    void Send();
};
