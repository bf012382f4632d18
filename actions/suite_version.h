// The installed suite's version as the problem report's subject names it.
#pragma once

#include "base/string_ex.h"

// The installed suite's version ("2.0.1.123"), empty while it is unknown.
CStringEx ReportSuiteVersion();
