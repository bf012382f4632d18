// The suite's Start-menu and desktop shortcuts.
#pragma once

void AddShortcuts();
// Non-zero when a desktop shortcut was renamed, or a desktop holds none.
int UpdateShortcuts();
void MoveShortcuts();
void UnInstallShortcuts();
