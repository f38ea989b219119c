// SPDX-License-Identifier: Apache-2.0
#include "measure/Paths.h"

#include <filesystem>
#include <system_error>

#include <wx/filename.h>

#include "base/WideBytes.h"

namespace measure {

std::string pathBytes(const wxString& path) {
    return base::bytesFromWide(path.ToStdWstring());
}

wxString pathBeside(const wxString& path, const char* name) {
    wxFileName beside(path);
    beside.SetFullName(name);
    return beside.GetFullPath();
}

bool fileExists(const wxString& path) {
    std::error_code ignored;
    return std::filesystem::is_regular_file(pathBytes(path), ignored);
}

} // namespace measure
