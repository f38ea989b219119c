// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/XmlCheck.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <new>

namespace admin {

XmlCheck::XmlCheck() : m_parser(XML_ParserCreateNS(nullptr, ' ')), m_stream(this) {
    if (m_parser == nullptr) {
        throw std::bad_alloc();
    }
}

XmlCheck::~XmlCheck() {
    XML_ParserFree(m_parser);
}

std::string XmlCheck::fault() {
    parse(nullptr, 0, true);
    return m_fault;
}

XmlCheck::int_type XmlCheck::overflow(int_type byte) {
    const char one = traits_type::to_char_type(byte);
    xsputn(&one, 1);
    return byte;
}

std::streamsize XmlCheck::xsputn(const char* bytes, std::streamsize count) {
    // FE and FF start UTF-16, EF BB BF starts UTF-8, and UTF-16 has zeros between characters.
    for (std::streamsize i = 0; i < count && m_firstByte == '\0'; ++i) {
        if (std::strchr(" \t\r\n\xFE\xFF\xEF\xBB\xBF", bytes[i]) == nullptr) {
            m_firstByte = bytes[i];
        }
    }
    constexpr std::streamsize step = 1 << 20;
    for (std::streamsize done = 0; done < count; done += step) {
        parse(bytes + done, static_cast<int>(std::min(step, count - done)), false);
    }
    return count;
}

void XmlCheck::parse(const char* bytes, int count, bool last) {
    if (m_fault.empty() && XML_Parse(m_parser, bytes, count, last ? 1 : 0) != XML_STATUS_OK) {
        m_fault = "line " + std::to_string(XML_GetCurrentLineNumber(m_parser)) + ": " +
                  XML_ErrorString(XML_GetErrorCode(m_parser));
    }
}

bool isXmlName(const std::string& path) {
    std::string ending = path.substr(std::min(path.size(), path.rfind('.')));
    std::transform(ending.begin(), ending.end(), ending.begin(),
                   [](unsigned char sign) { return std::tolower(sign); });
    return ending == ".jdf" || ending == ".jmf" || ending == ".xml";
}

} // namespace admin
