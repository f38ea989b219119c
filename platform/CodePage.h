// SPDX-License-Identifier: Apache-2.0
// The platform's own single-byte encodings.
#pragma once

#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "platform/CoreFoundationStrings.h"

namespace platform {

/// A code page of 256 distinct characters with ASCII as its lower half.
///
/// ICU supplies the upper half of most pages. Loading its libraries costs a third of the startup of
/// an empty program, so they are opened for the first text that is not ASCII.
class CodePage {
  public:
    /// Null if there is no conversion for the encoding.
    static const CodePage* find(CFStringEncoding encoding);

    /// A page that ICU calls `converter`.
    CodePage(CFStringEncoding encoding, const char* converter)
        : m_encoding(encoding), m_converter(converter) {}

    /// A page with the given characters 0x80 to 0xFF.
    CodePage(CFStringEncoding encoding, std::u16string_view upper)
        : m_encoding(encoding), m_upper(upper) {}

    /// Nothing if the upper half is needed and not available.
    std::optional<std::u16string> decode(std::string_view bytes) const;

    /// Nothing if a character is not on this page. There are no near matches.
    std::optional<std::string> encode(std::u16string_view units) const;

  private:
    std::u16string_view upper() const;

    const CFStringEncoding m_encoding;
    const char* const m_converter = nullptr;
    mutable std::once_flag m_loaded;
    mutable std::u16string m_upper; ///< 128 characters, or empty.
};

} // namespace platform
