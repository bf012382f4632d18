#include "actions/suite_version.h"

// Names the installed suite's version. The version lookup of the suite is
// not part of the program yet, so the version is unknown: empty.
CStringEx ReportSuiteVersion() {
    return CStringEx();
}
