#include "actions/island_result.h"

CStringEx IslandField(const COIXML& island, const wchar_t* name, const wchar_t* lowerName) {
    CStringEx value;
    if (island.GetChildValue(name, value) != 0) {
        island.GetChildValue(lowerName, value);
    }
    return value;
}

bool IslandReportsSuccess(const COIXML& island) {
    CStringEx status = IslandField(island, L"Status", L"status");
    status.TrimLeft(L' ');
    status.TrimRight(L' ');
    return status.CompareNoCase(L"SUCCESS") == 0;
}

CStringEx UploadedFileName(const COIXML& island) {
    CStringEx path = IslandField(island, L"FilePath", L"filepath");
    path.TrimLeft(L'/');
    path.TrimLeft(L'\\');
    return path;
}
