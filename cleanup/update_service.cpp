#include "cleanup/update_service.h"

// The service removal arrives with the update service work.
BOOL SvcUninstall() {
    return FALSE;
}
