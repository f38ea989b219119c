// SPDX-License-Identifier: Apache-2.0
// A folder of a test's own, gone when the test ends.
#pragma once

#include <filesystem>
#include <string>

namespace support {

class ScratchFolder {
  public:
    ScratchFolder();
    ~ScratchFolder();
    ScratchFolder(const ScratchFolder&) = delete;
    ScratchFolder& operator=(const ScratchFolder&) = delete;

    /// Of the folder, or of a name in it, as bytes. Nothing is made.
    const std::string& path() const { return m_path; }
    std::string path(const std::string& name) const { return m_path + "/" + name; }

    /// Writes a file of this name, makes the folders above it, and returns its path.
    std::string write(const std::string& name, const std::string& contents) const;

    /// Makes a folder of this name and returns its path.
    std::string makeFolder(const std::string& name) const;

  private:
    std::string m_path;
};

/// Whole contents of a file; throws where there is none, so that an empty file is not mistaken for
/// a missing one.
std::string contentsOf(const std::string& path);

/// True if there is anything of this name, a dangling link included.
bool exists(const std::string& path);

/// Permission bits of a file, such as 0600.
unsigned modeOf(const std::string& path);

} // namespace support
