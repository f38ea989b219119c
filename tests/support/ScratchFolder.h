// SPDX-License-Identifier: Apache-2.0
// A temporary folder that is removed at the end of the test.
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

    /// Path of the folder, or of a name in it, as bytes. Creates nothing.
    const std::string& path() const { return m_path; }
    std::string path(const std::string& name) const { return m_path + "/" + name; }

    /// Writes a file of this name, creates missing folders, and returns its path.
    std::string write(const std::string& name, const std::string& contents) const;

    /// Creates a folder of this name and returns its path.
    std::string makeFolder(const std::string& name) const;

  private:
    std::string m_path;
};

/// Contents of a file. Throws if it is missing, so that it can't be mistaken for an empty file.
std::string contentsOf(const std::string& path);

/// True if the name exists, even as a dangling link.
bool exists(const std::string& path);

/// Permission bits of a file, such as 0600.
unsigned modeOf(const std::string& path);

} // namespace support
