// Upload proxies: the "PPU" and "UPLOAD_FILE" Actions.
#pragma once

#include "actions/command_info.h"

// Drives the upload page and hands its feedback to the calling program; 0.
int RunUploadProxy(CommandInfo& commandInfo);
