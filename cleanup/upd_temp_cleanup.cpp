#include "cleanup/legacy_removal.h"

// Filled in with the update temporary folder cleanup.
void RemoveUpdTempFolder() {}
