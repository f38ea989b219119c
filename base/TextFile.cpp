// SPDX-License-Identifier: Apache-2.0
#include "base/TextFile.h"

#include <algorithm>
#include <climits>
#include <cstddef>
#include <cwchar>
#include <fstream>
#include <ostream>

namespace base {
namespace {

/// Stops at the first NUL, as the C library's converter does. A character that the encoding lacks
/// fails the stream, and nothing of the piece is written.
void writeConverted(std::ostream& stream, std::wstring_view piece) {
    const std::wstring wide(piece);
    const wchar_t* from = wide.c_str();
    std::string narrow(wide.size() * MB_LEN_MAX + 1, '\0');
    std::mbstate_t state = {};
    const std::size_t size = std::wcsrtombs(narrow.data(), &from, narrow.size(), &state);
    if (size == static_cast<std::size_t>(-1)) {
        stream.setstate(std::ios::failbit);
    } else {
        stream.write(narrow.data(), static_cast<std::streamsize>(size));
    }
}

/// False if a character is not ASCII. Works on bare pointers, so that the compiler can take several
/// characters at once.
bool narrowAscii(const wchar_t* from, std::size_t count, char* to) {
    wchar_t all = 0;
    for (std::size_t i = 0; i < count; ++i) {
        all |= from[i];
        to[i] = static_cast<char>(from[i]);
    }
    return (all & ~0x7F) == 0;
}

/// In pieces, because the narrow copy of a large result would use as much memory as the analysis
/// itself. ASCII pieces, such as all of ours, are narrowed here: the C library's converter would
/// take a seventh of a whole run.
void write(std::ostream& stream, std::wstring_view text) {
    constexpr std::size_t pieceLength = 1 << 18;
    std::string narrow;
    for (; !text.empty() && stream; text.remove_prefix(std::min(pieceLength, text.size()))) {
        const std::wstring_view piece = text.substr(0, pieceLength);
        narrow.resize(piece.size());
        if (narrowAscii(piece.data(), piece.size(), narrow.data())) {
            stream << narrow;
        } else {
            writeConverted(stream, piece);
        }
    }
}

} // namespace

bool writeTextInPlace(const std::string& path, std::wstring_view text) {
    std::ofstream output(path, std::ios::out | std::ios::trunc);
    if (!output) {
        return false;
    }
    write(output, text);
    output.close();
    return output.good();
}

} // namespace base
