#include "actions/service_gate.h"

// The Suite service's COM classes are reached with the service gate work;
// until then the Action does nothing and ends with 0.
int QMServiceHandle(CommandInfo& /*commandInfo*/) {
    return 0;
}
