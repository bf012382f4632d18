// The Windows Installer's packed GUIDs in their braced form.
#include <gtest/gtest.h>

#include <string>

#include "cleanup/packed_guid.h"

TEST(PackedGuidTest, BothFormsFollowTheInstallerRuleAndTheCheckedOneRefusesOtherLengths) {
    const wchar_t* const cases[][2] = {
        {L"39A1EB3B91C93B54EAD80FE3C665084C", L"{B3BE1A93-9C19-45B3-AE8D-F03E6C5680C4}"},
        {L"E4698B57199D4B241AF129150B2CCAE2", L"{75B8964E-D991-42B4-A11F-9251B0C2AC2E}"},
        {L"39A1EB3B91C93B54EAD80FE3C665084", nullptr},
        {L"39A1EB3B91C93B54EAD80FE3C665084CD", nullptr}};
    for (const auto& c : cases) {
        wchar_t out[39] = L"stale";
        EXPECT_EQ(c[1] != nullptr, PackedGuidStringToGuid(c[0], out, 39));
        EXPECT_EQ(std::wstring(c[1] ? c[1] : L""), out);
        if (c[1] != nullptr) {
            EXPECT_TRUE(PackedGuidToGuid(c[0], out, 39));
            EXPECT_EQ(std::wstring(c[1]), out);
            EXPECT_FALSE(PackedGuidToGuid(c[0], out, 38));  // no room for the terminator
        }
    }
}
