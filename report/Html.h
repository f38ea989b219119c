// SPDX-License-Identifier: Apache-2.0
// Markup from texts of tickets and files, which can't change what the markup means.
#pragma once

#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace report {

/// Markup. Only the functions below make it, so no text gets into it unescaped.
class Html {
  public:
    Html() = default;
    /// Text as such: what has a meaning in markup or in a quoted attribute is escaped, and control
    /// characters that HTML does not allow become U+FFFD.
    explicit Html(std::string_view text);

    const std::string& markup() const { return m_markup; }
    Html& operator+=(const Html& other);

  private:
    friend Html element(std::string_view tag,
                        std::initializer_list<std::pair<std::string_view, std::string_view>>,
                        const Html& content);
    std::string m_markup;
};

/// <tag name="value">content</tag>. Attributes with an empty value are left out.
Html element(std::string_view tag,
             std::initializer_list<std::pair<std::string_view, std::string_view>> attributes,
             const Html& content = {});

/// The same with text, and without attributes.
Html element(std::string_view tag, std::string_view text);

Html operator+(Html first, const Html& second);

} // namespace report
