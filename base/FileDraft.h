// SPDX-License-Identifier: Apache-2.0
// Files that appear whole or not at all.
#pragma once

#include <string>
#include <string_view>

#include <sys/types.h>

#include "base/Descriptor.h"

namespace base {

/// A file under a temporary name in the folder of its target, until it is complete. A draft that
/// does not get its name is removed when the object goes; one that a killed process leaves is
/// called ".tintgate-new-" and six characters.
///
/// Every member that fails sets errno.
class FileDraft {
  public:
    /// Creates the draft, with the permissions that any new file of this process gets.
    explicit FileDraft(const std::string& target);
    ~FileDraft();
    FileDraft(const FileDraft&) = delete;
    FileDraft& operator=(const FileDraft&) = delete;

    bool isOpen() const { return m_file.isOpen(); }
    /// For those who write on their own; path() stays valid until the draft has its name.
    const Descriptor& descriptor() const { return m_file; }
    const std::string& path() const { return m_path; }

    bool write(std::string_view bytes) const;

    /// Takes over the permissions of the file that is to be replaced and, if this process may give
    /// files away, its owner. File systems without permissions are not a failure.
    bool keepAccessOf(const std::string& old) const;

    /// Brings the content to the disk and gives the draft its name, in place of a file that has it.
    bool replace(const std::string& target);
    /// The same if the name is free; otherwise errno is EEXIST and the draft can try another name.
    bool nameFresh(const std::string& target);

  private:
    bool finish();

    std::string m_path; ///< Empty if there is no draft (any more).
    Descriptor m_file;
};

/// Writes a file whole: a regular file or a missing one through a draft, keeping the access of the
/// one that was there. Symbolic links are followed and remain links. False with errno set; then the
/// old file is unchanged.
bool writeWholeFile(const std::string& path, std::string_view bytes);

} // namespace base
