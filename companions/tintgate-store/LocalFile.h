// SPDX-License-Identifier: Apache-2.0
// Local files.
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

/// Writes a file; "-" is standard output. A file is first written under another name in its folder
/// and appears complete, so a failure keeps the old file. Devices and pipes are written in place.
/// Throws Failure (LocalFile), and what `write` throws.
void writeLocalFile(const std::string& path, const std::function<void(std::ostream&)>& write);

/// Flushes standard output. Throws Failure (LocalFile) if not everything could be written.
void finishStandardOutput();

} // namespace admin
