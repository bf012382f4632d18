// Keeping file work inside the folder it was meant for. Run as the system
// account under an installer, the program writes, deletes, renames and
// schedules deletions in folders the console user controls (the Notes data
// folder, the user's application data, the user's temporary folder). A
// junction or symbolic link planted there would carry that work to any place
// on the machine, so every such step first asks:
//
//   if (!IsFreeOfReparsePoints(dataFolder, target)) { ...fail the step as usual... }
//
// trustedRoot is the folder as the shell or the registry handed it out. It is
// taken as it is (the shell's own folders may themselves be links); only what
// lies below it is looked at.
#pragma once

// True when path lies inside trustedRoot (compared without regard to case)
// and no existing component of path below trustedRoot, the last one included,
// is a reparse point. The walk ends at the first component that does not
// exist: what the caller creates there is its own. False, with a level-4
// record naming the reparse point, when one is found; false also when either
// argument is missing, when path is not inside trustedRoot, or when a
// component below it is "." or "..".
bool IsFreeOfReparsePoints(const wchar_t* trustedRoot, const wchar_t* path);
