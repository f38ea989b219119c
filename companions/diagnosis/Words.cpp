// SPDX-License-Identifier: Apache-2.0
#include "companions/diagnosis/Words.h"

#include <algorithm>
#include <iterator>

#include "ExitCodes.h"
#include "base/WideBytes.h"

namespace diagnosis {

namespace {

const ExitCodeText* textOf(int code) {
    const auto found = std::find_if(std::begin(exitCodeTexts), std::end(exitCodeTexts),
                                    [&](const ExitCodeText& text) { return text.code == code; });
    return found == std::end(exitCodeTexts) ? nullptr : &*found;
}

} // namespace

std::string bytesOf(const wxString& text) {
    return base::bytesFromWide(text.ToStdWstring());
}

std::string fileName(const std::string& path) {
    return path.substr(path.rfind('/') + 1);
}

std::string explained(int code) {
    const ExitCodeText* const text = textOf(code);
    return std::to_string(code) + (text == nullptr
                                       ? std::string()
                                       : std::string(", ") + text->meaning + ". " + text->cause);
}

} // namespace diagnosis
