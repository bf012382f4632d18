#include "cleanup/shortcuts.h"

// The shortcut work arrives with the shortcut commands.
void AddShortcuts() {}
int UpdateShortcuts() {
    return 0;
}
void MoveShortcuts() {}
void UnInstallShortcuts() {}
