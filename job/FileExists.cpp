// SPDX-License-Identifier: Apache-2.0
#include "job/FileExists.h"

#include <filesystem>
#include <system_error>

#include "cli/CLogger.h"
#include "measure/StripLines.h"

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
