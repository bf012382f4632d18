// File helpers for arranging and checking a scratch machine.
#pragma once

#include <string>
#include <vector>

bool FileExists(const std::wstring& path);
bool DirExists(const std::wstring& path);
// Creates the folder and its missing parents.
bool MakeDirs(const std::wstring& path);
// Writes bytes, creating missing parent folders.
bool WriteFileBytes(const std::wstring& path, const std::string& bytes);
std::string ReadFileBytes(const std::wstring& path);
// How many times part occurs in text.
int CountOf(const std::string& text, const std::string& part);
// Removes a file or a whole folder tree (read-only entries included).
void RemoveTree(const std::wstring& path);
// Names of the entries of a folder, without "." and "..", sorted.
std::vector<std::wstring> ListDir(const std::wstring& path);
std::wstring JoinPath(const std::wstring& folder, const std::wstring& name);
std::string Narrow(const std::wstring& text);
std::wstring Widen(const std::string& text);
