// SPDX-License-Identifier: Apache-2.0
// Files that appear complete or not at all.
#pragma once

#include <string>
#include <string_view>

#include <sys/types.h>

#include "base/Descriptor.h"

namespace base {

/// A file under a temporary name in its target's folder until it is complete. Its destructor
/// removes a draft that was not renamed. A killed process leaves a draft called ".tintgate-new-"
/// plus six characters.
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
    /// For callers that write themselves. path() is valid until the draft is renamed.
    const Descriptor& descriptor() const { return m_file; }
    const std::string& path() const { return m_path; }

    bool write(std::string_view bytes) const;

    /// Copies the permissions of the file to be replaced and, if this process may change owners,
    /// its owner. File systems without permissions are not a failure.
    bool keepAccessOf(const std::string& old) const;

    /// Flushes the content to disk and renames the draft, replacing any file of that name.
    bool replace(const std::string& target);
    /// Same if the name is free. Otherwise errno is EEXIST and the draft can try another name.
    bool nameFresh(const std::string& target);

  private:
    bool finish();

    std::string m_path; ///< Empty if there is no draft.
    Descriptor m_file;
};

/// Writes a complete file. Regular and missing files are written as a draft that keeps the old
/// file's access. Symbolic links are followed and remain links. Returns false with errno set on
/// failure; the old file is then unchanged.
bool writeWholeFile(const std::string& path, std::string_view bytes);

} // namespace base
