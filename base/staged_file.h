// One way to rewrite a file we do not own: the new content is written to a
// staging file beside the target (same folder, so the final rename stays on
// one volume), flushed, and then replaces the target in one step. Until the
// replacement the target keeps its old bytes; a staging file that is not
// committed is removed.
//
//   StagedFile staged(L"C:\\...\\platform.xml");
//   if (staged.Begin() && doc->save(staged.Path()) == S_OK && staged.Commit()) ...
#pragma once

#include <windows.h>

#include <string>

class StagedFile {
public:
    explicit StagedFile(const wchar_t* target);
    ~StagedFile();  // removes the staging file unless committed
    StagedFile(const StagedFile&) = delete;
    StagedFile& operator=(const StagedFile&) = delete;

    // Creates an empty staging file in the target's folder. False when the
    // target has no folder or the folder cannot be written.
    bool Begin();
    // Where the new content goes; empty before Begin.
    const wchar_t* Path() const { return m_staging.c_str(); }
    // Writes bytes into the staging file (replacing what it holds).
    bool Write(const void* bytes, size_t size);
    // Flushes the staging file, gives it the target's access rules and owner,
    // moves it over the target and gives it the target's attributes. A
    // read-only target is not replaced. False leaves the target as it was
    // and removes the staging file.
    bool Commit();

private:
    void Discard();

    std::wstring m_target;
    std::wstring m_staging;
    bool m_committed = false;
};

// Replaces target's content with bytes through a StagedFile.
bool WriteFileStaged(const wchar_t* target, const void* bytes, size_t size);
