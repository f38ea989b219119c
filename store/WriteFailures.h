// SPDX-License-Identifier: Apache-2.0
// Writes that a server did not take, kept for people: exit codes and a run's log do not mention
// them. A file in the temporary folder has a line for each, as LineFile.h describes:
//
//   2024-05-01T12:34:56Z  /srv/tintgate  job/7  Remote/Measurement/Status  the store is locked
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "store/LineFile.h"

namespace store {

struct WriteFailure {
    std::int64_t time = 0; ///< Seconds since 1970.
    std::string server;    ///< The address given by the client.
    std::string target;    ///< A ticket, such as job/7 or 27/1; "file" for an upload.
    std::string key;       ///< Key of the ticket, or server path of an upload; may be empty.
    std::string reason;
};

/// The name of a ticket in a line of this file.
std::string ticketNameOf(int type, int id);

class WriteFailures {
  public:
    /// A user's file in a folder for temporary files. With an empty folder, nothing is recorded.
    explicit WriteFailures(const std::string& folder);

    const std::string& path() const { return m_file.path(); }

    /// What fails here is passed over, and a file of another user or a link is left alone.
    void add(const WriteFailure& failure) const;

    /// All lines of the file, with \xNN unchanged. Invalid lines are left out.
    std::vector<WriteFailure> all() const;

  private:
    LineFile m_file;
};

} // namespace store
