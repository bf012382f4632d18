// The table of Maintenance command keywords, in the order of testing.
#pragma once

struct MaintenanceKeyword {
    const wchar_t* keyword;
    int (*job)();
    // True when the keyword ends the dispatcher with the job's result; the
    // others end with 0.
    bool returnsResult;
};

// The 40 keywords; count receives their number.
const MaintenanceKeyword* GetMaintenanceKeywords(int* count);

// The first entry whose keyword equals `keyword` by lstrcmpiW, or null.
const MaintenanceKeyword* FindMaintenanceKeywordEntry(const wchar_t* keyword);
