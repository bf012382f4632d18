// The Eclipse configuration stamp: when "last.config.stamp" is renamed away,
// Eclipse rebuilds its configuration at its next start.
#pragma once

// In configFolder: deletes "last.config.stamp.bak" when present, then renames
// "last.config.stamp" to it (a missing stamp is no error).
void RenameConfigStamp(const wchar_t* configFolder);

// The stamp of an Eclipse installation or data folder: the rename above in
// baseFolder\configuration\org.eclipse.update, when that folder exists and
// no reparse point below baseFolder leads elsewhere.
void ResetEclipseConfigStamp(const wchar_t* baseFolder);
