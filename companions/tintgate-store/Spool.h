// SPDX-License-Identifier: Apache-2.0
// A file without a name, between two stores of which one gives and the other one takes.
#pragma once

#include <fstream>

namespace admin {

/// Throws Failure (LocalFile) if the temporary folder has no room for it.
class Spool {
  public:
    Spool();

    std::ostream& toWrite() { return m_stream; }
    /// From its start.
    std::istream& toRead();

  private:
    std::fstream m_stream;
};

/// Whether two spools have the same bytes.
bool areEqual(Spool& one, Spool& other);

} // namespace admin
