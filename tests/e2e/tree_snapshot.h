// What lies below a folder, to show that a run changed nothing there.
#pragma once

#include <functional>
#include <map>
#include <string>

#include "tests/support/file_util.h"

// Relative path -> hash of the bytes of every file below root (folders with
// a trailing backslash and no bytes). The logs of the program's runs are
// left out.
inline std::map<std::wstring, size_t> TreeSnapshot(const std::wstring& root,
                                                   const std::wstring& rel = L"") {
    std::map<std::wstring, size_t> items;
    for (const std::wstring& name : ListDir(JoinPath(root, rel))) {
        std::wstring item = rel.empty() ? name : JoinPath(rel, name);
        if (DirExists(JoinPath(root, item))) {
            items[item + L"\\"] = 0;
            std::map<std::wstring, size_t> below = TreeSnapshot(root, item);
            items.insert(below.begin(), below.end());
        } else if (name.size() < 4 || name.compare(name.size() - 4, 4, L".log") != 0) {
            items[item] = std::hash<std::string>()(ReadFileBytes(JoinPath(root, item)));
        }
    }
    return items;
}
