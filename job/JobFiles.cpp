#include "job/JobFiles.h"

#include <algorithm>
#include <cstddef>
#include <filesystem>
#include <fstream>
#include <ostream>
#include <system_error>

#include "cli/CLogger.h"
#include "measure/ControlStripText.h"

namespace {

/// Through wxString in pieces, since the narrow copy of a large result would cost as much memory as
/// the analysis itself. A piece of plain ASCII, as all of ours are, is narrowed here: wx goes
/// through the C library's converter twice, which took a seventh of a whole run.
void writeText(std::ostream& stream, std::wstring_view text) {
    constexpr std::size_t pieceLength = 1 << 18;
    std::string narrow;
    for (; !text.empty() && stream; text.remove_prefix(std::min(pieceLength, text.size()))) {
        const std::wstring_view piece = text.substr(0, pieceLength);
        narrow.resize(piece.size());
        wchar_t all = 0;
        for (std::size_t i = 0; i < piece.size(); ++i) {
            all |= piece[i];
            narrow[i] = static_cast<char>(piece[i]);
        }
        if ((all & ~0x7F) == 0) {
            stream << narrow;
        } else {
            stream << wxString(piece.data(), piece.size());
        }
    }
}

} // namespace

bool fileExists(const wxString& path) {
    std::error_code ignored;
    return std::filesystem::is_regular_file(measure::pathBytes(path), ignored);
}

bool isThere(const wxString& path, const char* complaint) {
    const bool found = fileExists(path);
    if (!found) {
        CLogger::GetLogger()->Log("%s file not found = %s", complaint,
                                  measure::pathBytes(path).c_str());
    }
    return found;
}

bool writeTextFile(const std::string& path, std::wstring_view text) {
    std::ofstream output(path, std::ios::out | std::ios::trunc);
    if (!output) {
        return false;
    }
    writeText(output, text);
    output.close();
    return output.good();
}
