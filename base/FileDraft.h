// SPDX-License-Identifier: Apache-2.0
// Files that appear complete or not at all.
#pragma once

#include <string>
#include <string_view>

#include "base/Descriptor.h"

namespace base {

/// No is for working copies, which are fetched again after a loss of power. A flush takes
/// milliseconds.
enum class Flush { Yes, No };

/// A file in its target's folder that has no name until it is complete, so that a killed process
/// leaves nothing. On file systems without unnamed files it is called ".tintgate-new-" plus six
/// characters; the destructor removes such a draft.
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
    /// Opens the draft for callers that write themselves, until it is named.
    const std::string& path() const { return m_path; }

    bool write(std::string_view bytes) const;

    /// Copies the permissions of the file to be replaced and, if this process may change owners,
    /// its owner. Not a failure: no such file, or a file system without permissions.
    bool keepAccessOf(const std::string& old) const;

    /// Flushes the content to disk and names the draft, replacing any file of that name.
    bool replace(const std::string& target, Flush flush = Flush::Yes);
    /// Same if the name is free. Otherwise errno is EEXIST and the draft can try another name.
    bool nameFresh(const std::string& target);

  private:
    bool giveOwnName();

    const std::string m_prefix; ///< Of temporary names.
    Descriptor m_file;
    std::string m_path;
    bool m_hasName = false; ///< Of its own, at m_path.
};

} // namespace base
