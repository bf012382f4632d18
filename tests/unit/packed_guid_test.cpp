// The Windows Installer's packed GUIDs in their braced form.
#include <gtest/gtest.h>

#include <string>

#include "cleanup/packed_guid.h"

namespace {

struct PackedCase {
    const wchar_t* packed;
    const wchar_t* braced;
};

const PackedCase kCases[] = {
    {L"39A1EB3B91C93B54EAD80FE3C665084C", L"{B3BE1A93-9C19-45B3-AE8D-F03E6C5680C4}"},
    {L"E4698B57199D4B241AF129150B2CCAE2", L"{75B8964E-D991-42B4-A11F-9251B0C2AC2E}"},
};

TEST(PackedGuidTest, BothFormsConvertTheInstallerRule) {
    for (const PackedCase& c : kCases) {
        wchar_t out[39] = {};
        EXPECT_TRUE(PackedGuidToGuid(c.packed, out, 39));
        EXPECT_EQ(std::wstring(c.braced), out);
        wchar_t checked[260] = {};
        EXPECT_TRUE(PackedGuidStringToGuid(c.packed, checked, 260));
        EXPECT_EQ(std::wstring(c.braced), checked);
    }
    // No room for the terminator.
    wchar_t small[38];
    EXPECT_FALSE(PackedGuidToGuid(kCases[0].packed, small, 38));
}

TEST(PackedGuidTest, CheckedFormRefusesAnyOtherLength) {
    for (const wchar_t* packed :
         {L"39A1EB3B91C93B54EAD80FE3C665084", L"39A1EB3B91C93B54EAD80FE3C665084CD", L""}) {
        wchar_t out[260] = L"stale";
        EXPECT_FALSE(PackedGuidStringToGuid(packed, out, 260));
        EXPECT_EQ(std::wstring(), out);
    }
}

}  // namespace
