#include "presence/custom_status.h"

// The presence state arrives with the custom status work.
int CMOCCustomStatusInstall::SilentInstall() {
    return 0;
}
