// SPDX-License-Identifier: Apache-2.0
// Permissions of the files in a store's folder.
#pragma once

#include <string>

#include <sys/types.h>

namespace store {

/// Everything in a store is as accessible to the store's group as its folder is, and never to
/// others. So all accounts of the group can use a folder of mode 2770, whatever their umasks, and
/// nobody else can use a folder of mode 0700.
class Permissions {
  public:
    /// The permissions of an open folder. Throws StoreFailure.
    static Permissions of(int folder);

    /// Gives a new, open file or folder these permissions and the folder's group. If this process
    /// can't give it that group, only its owner can use it. False with errno set.
    bool giveTo(int made) const;
    /// Same for a path.
    bool giveTo(const std::string& path) const;

  private:
    mode_t m_mode = 0;
    gid_t m_group = 0;
};

} // namespace store
