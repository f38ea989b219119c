// SPDX-License-Identifier: Apache-2.0
// Text files of bounded size in which each line is an event, for people and scripts:
//
//   2024-05-01T12:34:56Z  /srv/tintgate  job/7  Remote/Measurement/Status  the store is locked
//
// with tabs between the parts. Bytes that are no printable ASCII character, and backslashes, are
// written as \xNN. Writing is best effort: what fails is passed over.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace store {

/// What one line has.
struct Line {
    std::int64_t time = 0;          ///< Seconds since 1970.
    std::vector<std::string> parts; ///< As they were read, with \xNN as it is.
};

std::string lineText(std::int64_t time, const std::vector<std::string_view>& parts);

class LineFile {
  public:
    /// With an empty path nothing is kept. A file that is not shared counts only if it belongs to
    /// this user.
    LineFile(std::string path, bool shared);

    const std::string& path() const { return m_path; }

    /// Appends a line of lineText in one piece. A new file has mode 0600 and is shown to `made`. A
    /// file of a megabyte is put aside first, under its name and ".old". A link is left alone.
    void append(const std::string& line, const std::function<void(int file)>& made = {}) const;

    /// The lines with so many parts, without those of the file that was put aside. With a limit,
    /// those at the end of the file, up to so many bytes.
    std::vector<Line> lines(std::size_t parts, std::size_t longest = 0) const;
    /// The lines of the file that was put aside.
    std::vector<Line> formerLines(std::size_t parts) const;

  private:
    std::string m_path;
    bool m_shared;
};

} // namespace store
