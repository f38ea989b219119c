// SPDX-License-Identifier: Apache-2.0
// Who may use what is in a store's folder.
#pragma once

#include <string>

#include <sys/types.h>

namespace store {

/// Everything in a store is as open to the store's group as its folder is, and never to others. So
/// all accounts of the group can use a folder of mode 2770, whatever their umasks, and nobody else
/// a folder of mode 0700.
class Permissions {
  public:
    /// Those of an open folder. Throws StoreFailure.
    static Permissions of(int folder);

    /// Gives a new file or folder, which is open, these permissions and the folder's group. If this
    /// process may not give it that group, only its owner can use it. False with errno set.
    bool giveTo(int made) const;
    /// The same, by a path.
    bool giveTo(const std::string& path) const;

  private:
    mode_t m_mode = 0;
    gid_t m_group = 0;
};

} // namespace store
