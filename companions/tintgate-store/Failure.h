// How a command of tintgate-store ends.
#pragma once

#include <stdexcept>
#include <string>

#include "store/StoreEngine.h"

namespace admin {

/// The exit status of the program. The numbers are in its help and in docs/stores.md.
enum class Status : int {
    Done = 0,
    NotThere = 1,     ///< No such ticket, key, user, file or version.
    Exists = 2,       ///< There is one already.
    BadInput = 3,     ///< A value, name, password or JSON file that is refused.
    NoStore = 4,      ///< No store at that address.
    Older = 5,        ///< A store that "upgrade" brings up to date.
    Newer = 6,        ///< A store of a later version of this program.
    ReadOnly = 7,     ///< The store can't be written by this user.
    Full = 8,         ///< No room.
    Busy = 9,         ///< Others held the store for too long.
    Damaged = 10,     ///< What is stored makes no sense.
    BadPath = 11,     ///< A server path that leads to no file inside the store.
    LocalFile = 12,   ///< A file of this machine can't be read or written.
    Other = 13,       ///< Anything else; the message tells.
    Lost = 14,        ///< The server was lost on the way.
    JdfNotSound = 15, ///< A JDF that is not well-formed, or that would mislead its update.
    JdfTooLarge = 16, ///< A JDF beyond what an update is prepared for.
    BadCommand = 64,  ///< The command line is not understood.
};

/// Ends a command. The text is a sentence for people, without a full stop.
class Failure : public std::runtime_error {
  public:
    Failure(Status status, const std::string& text) : std::runtime_error(text), status(status) {}

    const Status status;
};

constexpr Status statusOf(store::Fault fault) {
    switch (fault) {
    case store::Fault::Missing:
        return Status::NoStore;
    case store::Fault::Newer:
        return Status::Newer;
    case store::Fault::Older:
        return Status::Older;
    case store::Fault::ReadOnly:
        return Status::ReadOnly;
    case store::Fault::Full:
        return Status::Full;
    case store::Fault::Busy:
        return Status::Busy;
    case store::Fault::Damaged:
        return Status::Damaged;
    case store::Fault::BadPath:
        return Status::BadPath;
    case store::Fault::NoFile:
        return Status::NotThere;
    case store::Fault::Exists:
        return Status::Exists;
    case store::Fault::Lost:
        return Status::Lost;
    case store::Fault::Other:
        break;
    }
    return Status::Other;
}

} // namespace admin
