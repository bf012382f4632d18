// String ids of the test program's own string table (string_table.rc),
// chosen at the edges of the 16-entry blocks.
#pragma once

#define IDS_TEST_ZERO 0
#define IDS_TEST_UNSET_FIRST_BLOCK 1
#define IDS_TEST_EMPTY 2
#define IDS_TEST_FIFTEEN 15
#define IDS_TEST_SIXTEEN 16
#define IDS_TEST_UNSET_SECOND_BLOCK 17
#define IDS_TEST_FORTY_FIVE 45
#define IDS_TEST_NON_ASCII 46
#define IDS_TEST_LONG 47
#define IDS_TEST_IN_MISSING_BLOCK 200
