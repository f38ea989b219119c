// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdexcept>
#include <string>

namespace base {

/// How our own code reports a failure: a status that callers decide by, and a sentence for people,
/// without a full stop, which names the place.
template<class Status>
class Failure : public std::runtime_error {
  public:
    Failure(Status status, const std::string& text) : std::runtime_error(text), status(status) {}

    const Status status;
};

} // namespace base
