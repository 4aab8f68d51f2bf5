// Files for tests: a temporary directory that owns everything created in it and is removed with
// it, and whole-file reads and writes. Creating the directory, reading and writing throw
// std::runtime_error when the system refuses; removal never throws.
#pragma once

#include <string>

namespace testsupport {

// A fresh directory under $TMPDIR (or /tmp), removed with everything in it on destruction.
class TempDir {
public:
    TempDir();
    ~TempDir();
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;

    const std::string& Path() const { return path_; }
    // The path of name inside the directory.
    std::string operator/(const std::string& name) const { return path_ + "/" + name; }

private:
    std::string path_;
};

// The whole file, byte for byte.
std::string ReadFile(const std::string& path);
// Replaces the file's contents with text, creating it when missing.
void WriteFile(const std::string& path, const std::string& text);

}  // namespace testsupport
