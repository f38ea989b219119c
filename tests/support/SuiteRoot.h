// SPDX-License-Identifier: Apache-2.0
// A system root of a test's own, with the suite's parts in it.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "ScratchFolder.h"

namespace support {

/// Made and set (TINTGATE_ROOT) for as long as it lives. It starts empty.
class SuiteRoot {
  public:
    /// The root is a folder of this name in a scratch folder.
    explicit SuiteRoot(const std::string& name = "root");
    ~SuiteRoot();

    /// Of the root, or of a name in it.
    const std::string& path() const { return m_path; }
    std::string path(const std::string& name) const { return m_path + "/" + name; }

    /// Writes a file of this name, makes the folders above it, and returns its path.
    std::string write(const std::string& name, const std::string& text) const;

    /// Puts the property-list reader where the tool looks for it.
    void installPlistReader(const std::string& program) const;

    /// Says in a property list of the Library's Preferences where parts of the suite are: pairs of
    /// a key and a path; a key with a slash is that of an entry in a nested dictionary.
    void writePreferences(const std::string& name,
                          const std::vector<std::pair<std::string, std::string>>& values) const;

    /// Makes a bundle in a folder of the root: the shared object and its Info.plist, whose entries
    /// are given as XML. Returns the bundle's path.
    std::string makeBundle(const std::string& name, const std::string& sharedObject,
                           const std::string& entries) const;

    /// Puts a comm bundle where the tool looks for it, as a link, and says so in the Library.
    void installCommBundle(const std::string& bundle) const;

    /// Copies a program to a name in the root and returns its path.
    std::string copyProgram(const std::string& program, const std::string& name) const;

  private:
    const ScratchFolder m_folder;
    const std::string m_name;
    const std::string m_path;
};

/// The entry of a plug-in bundle's shared object, types and factories.
std::string plugInEntries(const std::string& executable, const std::string& type,
                          const std::string& factory, const std::string& function);

} // namespace support
