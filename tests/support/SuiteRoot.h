// SPDX-License-Identifier: Apache-2.0
// The test's own system root, with parts of the suite.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "ScratchFolder.h"

namespace support {

/// Created and set (TINTGATE_ROOT) during its lifetime. Starts empty.
class SuiteRoot {
  public:
    /// The root is a folder of this name in a scratch folder.
    explicit SuiteRoot(const std::string& name = "root");
    ~SuiteRoot();

    /// Path of the root, or of a name in it.
    const std::string& path() const { return m_path; }
    std::string path(const std::string& name) const { return m_path + "/" + name; }

    /// Writes a file of this name, creates missing folders, and returns its path.
    std::string write(const std::string& name, const std::string& text) const;

    /// Installs the property-list reader where the tool looks for it.
    void installPlistReader(const std::string& program) const;

    /// Writes a property list in Library/Preferences with locations of parts of the suite: pairs of
    /// a key and a path. A key with a slash is an entry in a nested dictionary.
    void writePreferences(const std::string& name,
                          const std::vector<std::pair<std::string, std::string>>& values) const;

    /// Creates a bundle in a folder of the root: the shared object and its Info.plist with these
    /// entries, in XML. Returns the bundle's path.
    std::string makeBundle(const std::string& name, const std::string& sharedObject,
                           const std::string& entries) const;

    /// Links a comm bundle where the tool looks for it, and registers it in Library.
    void installCommBundle(const std::string& bundle) const;

    /// Copies a program to a name in the root and returns its path.
    std::string copyProgram(const std::string& program, const std::string& name) const;

  private:
    const ScratchFolder m_folder;
    const std::string m_name;
    const std::string m_path;
};

/// The entries of a plug-in bundle: its shared object, types and factories.
std::string plugInEntries(const std::string& executable, const std::string& type,
                          const std::string& factory, const std::string& function);

} // namespace support
