// Files read and replaced as a whole. Any thread.
#pragma once

#include <string>

// False when the file is there but cannot be read, or is larger than a file of settings can be. A file that is missing
// is empty.
bool ReadWholeFile(const std::string& path, std::string& content);

// Held while a file is read, changed and replaced, so that no other process or thread does the same in its directory,
// as far as the file system knows locks.
class DirectoryLock {
public:
    explicit DirectoryLock(const std::string& path_of_file);
    ~DirectoryLock();
    DirectoryLock(const DirectoryLock&) = delete;
    DirectoryLock& operator=(const DirectoryLock&) = delete;

    [[nodiscard]] bool IsHeld() const { return descriptor_ >= 0; }

    // Writes a new file beside the old one and renames it. The permissions and, where allowed, the owner stay.
    [[nodiscard]] bool Replace(const std::string& content) const;

private:
    std::string path_;    // behind symbolic links
    int descriptor_;      // of the directory
};
