// The suite's Start-menu and desktop shortcuts: one-click, settings, help and
// uninstall, in a Start-menu folder named after the companion meeting
// application, and the one-click shortcut on the desktop.
#pragma once

// Creates the shortcuts in both program folders and the one-click shortcut
// on the common desktop (the user's desktop when that fails).
void AddShortcuts();
// Gives shortcuts of an older release the current names and icons and moves
// them into the current Start-menu folder. Non-zero when a desktop shortcut
// was renamed, or a desktop holds none.
int UpdateShortcuts();
// Moves shortcuts that a 32-bit installer running as the system account left
// in the system profile into the common Start menu and desktop.
void MoveShortcuts();
// Removes the suite's shortcuts, and its Start-menu folders once empty.
void UnInstallShortcuts();
