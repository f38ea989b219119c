// SPDX-License-Identifier: Apache-2.0
// The platform's own single-byte encodings.
#pragma once

#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "platform/CoreFoundationStrings.h"

namespace platform {

/// A code page of 256 different characters, the lower half ASCII.
///
/// The upper half of most pages comes from ICU. Loading its libraries costs a third of an empty
/// program's start, so they are opened when a text first holds anything but ASCII.
class CodePage {
  public:
    /// Null where there is no conversion for the encoding.
    static const CodePage* find(CFStringEncoding encoding);

    /// A page that ICU has under the name `converter`.
    CodePage(CFStringEncoding encoding, const char* converter)
        : m_encoding(encoding), m_converter(converter) {}

    /// A page whose characters 0x80 to 0xFF are given.
    CodePage(CFStringEncoding encoding, std::u16string_view upper)
        : m_encoding(encoding), m_upper(upper) {}

    /// Nothing if the upper half is needed and can't be had.
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
