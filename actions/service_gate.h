// The Suite service gate: Actions 3, 4, 6 and 8.
#pragma once

#include "actions/command_info.h"

// Sends the Action to the Suite service and waits for it; always 0.
int QMServiceHandle(CommandInfo& commandInfo);
