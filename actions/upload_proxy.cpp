#include "actions/upload_proxy.h"

// The browser-driven upload page arrives with the upload proxy work; until
// then the Action does nothing and ends with 0.
int RunUploadProxy(CommandInfo& /*commandInfo*/) {
    return 0;
}
