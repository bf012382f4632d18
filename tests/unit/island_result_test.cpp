// What an upload page's data island says: status, conference identifier and
// uploaded file name, with the field-name fallbacks the pages rely on.
#include <gtest/gtest.h>

#include "actions/island_result.h"

namespace {

struct IslandCase {
    const wchar_t* island;
    bool success;
    const wchar_t* confId;
    const wchar_t* fileName;
};

TEST(IslandResultTest, StatusAndResultFields) {
    const IslandCase cases[] = {
        {L"<r><Status> success </Status><CD>12345</CD></r>", true, L"12345", L""},
        {L"<r><status>SuCcEsS</status><cd>7</cd></r>", true, L"7", L""},
        // "Status" wins over "status", "CD" over "cd".
        {L"<r><status>success</status><Status>failed</Status></r>", false, L"", L""},
        {L"<r><cd>low</cd><CD>up</CD><Status>success</Status></r>", true, L"up", L""},
        {L"<r><Status>successful</Status></r>", false, L"", L""},
        {L"<r><Status></Status></r>", false, L"", L""},
        {L"<r><Status>success</Status><FilePath>/\\docs/a.txt</FilePath></r>", true, L"",
         L"docs/a.txt"},
        // Slashes go first, then backslashes: a slash behind a backslash stays.
        {L"<r><filepath>\\/x.txt</filepath></r>", false, L"", L"/x.txt"},
        {L"<r><FilePath>//\\\\y.txt</FilePath></r>", false, L"", L"y.txt"},
    };
    for (const IslandCase& c : cases) {
        COIXML island;
        island.SetXML(c.island);
        EXPECT_EQ(c.success, IslandReportsSuccess(island)) << c.island;
        EXPECT_STREQ(c.confId, IslandField(island, L"CD", L"cd").c_str()) << c.island;
        EXPECT_STREQ(c.fileName, UploadedFileName(island).c_str()) << c.island;
    }
}

}  // namespace
