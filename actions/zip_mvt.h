// Packs trace files into one zip archive, each file an entry named by its
// file name.
#pragma once

#include <windows.h>

#include <vector>

#include "actions/rpt_stream.h"
#include "base/string_ex.h"

class CZipMvt {
public:
    CZipMvt() = default;
    virtual ~CZipMvt();
    CZipMvt(const CZipMvt&) = delete;
    CZipMvt& operator=(const CZipMvt&) = delete;

    // Creates (or replaces) the zip at zipPath and adds each file of paths
    // that can be read, deflated; files that cannot are left out. 1 when the
    // zip could be created, else 0.
    BOOL CompressFile(const std::vector<CStringEx>& paths, const wchar_t* zipPath);

private:
    // Reads the file into the stream; false (stream empty) when it cannot.
    BOOL ReadFile(const wchar_t* path);
    // Adds the stream's bytes as the entry `path`'s file name names.
    void CompressMvtFile(const wchar_t* path);

    void* m_zip = nullptr;  // the zip writer's handle while open
    CRptStream m_stream;
};
