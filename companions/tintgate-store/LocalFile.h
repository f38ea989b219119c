// SPDX-License-Identifier: Apache-2.0
// Files of the machine that the program runs on.
#pragma once

#include <fstream>
#include <functional>
#include <iosfwd>
#include <string>

namespace admin {

/// Opens for reading; "-" is standard input. Throws Failure (LocalFile).
class LocalInput {
  public:
    explicit LocalInput(const std::string& path);
    std::istream& stream();

  private:
    std::ifstream m_file;
    bool m_standardInput;
};

/// Has a file written; "-" is standard output. A file appears whole, under another name in its
/// folder first, so that a failure leaves what was there; devices and pipes are written in place.
/// Throws Failure (LocalFile), and what write throws.
void writeLocalFile(const std::string& path, const std::function<void(std::ostream&)>& write);

/// Sends what was printed on its way; throws Failure (LocalFile) where standard output took less
/// than all.
void finishStandardOutput();

} // namespace admin
