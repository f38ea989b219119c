// SPDX-License-Identifier: Apache-2.0
#include "report/Html.h"

namespace report {
namespace {

std::string escaped(std::string_view text) {
    std::string safe;
    for (const char c : text) {
        switch (c) {
        case '<':
            safe += "&lt;";
            break;
        case '>':
            safe += "&gt;";
            break;
        case '&':
            safe += "&amp;";
            break;
        case '"':
            safe += "&quot;";
            break;
        case '\'':
            safe += "&#39;";
            break;
        default:
            if (static_cast<unsigned char>(c) < 0x20 && c != '\t' && c != '\n') {
                safe += "\uFFFD";
            } else {
                safe += c;
            }
        }
    }
    return safe;
}

} // namespace

Html::Html(std::string_view text) : m_markup(escaped(text)) {}

Html& Html::operator+=(const Html& other) {
    m_markup += other.m_markup;
    return *this;
}

Html element(std::string_view tag,
             std::initializer_list<std::pair<std::string_view, std::string_view>> attributes,
             const Html& content) {
    Html html;
    std::string& text = html.m_markup;
    text.append("<").append(tag);
    for (const auto& [name, value] : attributes) {
        if (!value.empty()) {
            text.append(" ").append(name).append("=\"").append(escaped(value)).append("\"");
        }
    }
    text.append(">").append(content.m_markup).append("</").append(tag).append(">");
    return html;
}

Html element(std::string_view tag, std::string_view text) {
    return element(tag, {}, Html(text));
}

Html operator+(Html first, const Html& second) {
    first += second;
    return first;
}

} // namespace report
