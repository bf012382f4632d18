// Removal of the suite's update service.
#pragma once

#include <windows.h>

// Stops and deletes "MirovanService"; 1 when deleted or already marked.
BOOL SvcUninstall();
