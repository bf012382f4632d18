#include "actions/zip_mvt.h"

#include <shlwapi.h>

#include <zip.h>
#include <iowin32.h>

#include "base/ansi_text.h"
#include "base/trace.h"

namespace {

const DWORD kWritePiece = 16 * 1024;

// Entry time: now, in UTC.
zip_fileinfo EntryInfo() {
    SYSTEMTIME now = {};
    GetSystemTime(&now);
    zip_fileinfo info = {};
    info.tmz_date.tm_year = now.wYear;
    info.tmz_date.tm_mon = now.wMonth - 1;
    info.tmz_date.tm_mday = now.wDay;
    info.tmz_date.tm_hour = now.wHour;
    info.tmz_date.tm_min = now.wMinute;
    info.tmz_date.tm_sec = now.wSecond;
    return info;
}

}  // namespace

CZipMvt::~CZipMvt() {
    if (m_zip != nullptr) {
        zipClose(m_zip, nullptr);
    }
}

BOOL CZipMvt::CompressFile(const std::vector<CStringEx>& paths, const wchar_t* zipPath) {
    CAutoFunTrace trace("CZipMvt::CompressFile");
    if (zipPath == nullptr) {
        return FALSE;
    }
    // The zip is opened by its wide path, so a folder whose name lies outside
    // the ANSI code page (a user name in another script) works too.
    zlib_filefunc64_def wideFiles = {};
    fill_win32_filefunc64W(&wideFiles);
    m_zip = zipOpen2_64(zipPath, APPEND_STATUS_CREATE, nullptr, &wideFiles);
    if (m_zip == nullptr) {
        return FALSE;
    }
    for (const CStringEx& path : paths) {
        ReadFile(path.c_str());
        CompressMvtFile(path.c_str());
    }
    zipClose(m_zip, nullptr);
    m_zip = nullptr;
    m_stream.Clear();
    return TRUE;
}

BOOL CZipMvt::ReadFile(const wchar_t* path) {
    CAutoFunTrace trace("CZipMvt::ReadFile");
    if (!m_stream.ReadFromFile(path, FALSE)) {
        TraceLevel2(TraceValue("CZip readfile failed"));
        return FALSE;
    }
    return TRUE;
}

void CZipMvt::CompressMvtFile(const wchar_t* path) {
    CAutoFunTrace trace("CZipMvt::CompressMvtFile");
    if (m_stream.Data() == nullptr || m_stream.Size() == 0) {
        return;
    }
    std::string entryName = WideToAnsi(PathFindFileNameW(path));
    zip_fileinfo info = EntryInfo();
    if (zipOpenNewFileInZip3(m_zip, entryName.c_str(), &info, nullptr, 0, nullptr, 0, nullptr,
                             Z_DEFLATED, Z_DEFAULT_COMPRESSION, 0, -MAX_WBITS, DEF_MEM_LEVEL,
                             Z_DEFAULT_STRATEGY, nullptr, 0) != ZIP_OK) {
        return;
    }
    TraceLevel2(TraceValue("compress -- read file sucess"));
    // In pieces, so the checksum and the compressor read each piece while it
    // is still in the processor's cache.
    const BYTE* data = m_stream.Data();
    for (DWORD done = 0; done < m_stream.Size();) {
        DWORD piece = m_stream.Size() - done < kWritePiece ? m_stream.Size() - done : kWritePiece;
        if (zipWriteInFileInZip(m_zip, data + done, piece) != ZIP_OK) {
            break;
        }
        done += piece;
    }
    zipCloseFileInZip(m_zip);
}
