#include "actions/suite_version.h"

#include "version/qm_version.h"

CStringEx ReportSuiteVersion() {
    CStringEx version;
    GetQMBuildNumber(version);
    return version;
}
