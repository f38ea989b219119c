// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/XmlMap.h"

#include <algorithm>
#include <iterator>
#include <memory>
#include <new>

#include <expat.h>

namespace admin {

namespace {

constexpr const char* blanks = " \t\r\n";

std::size_t skipBlanks(std::string_view text, std::size_t at) {
    return std::min(text.find_first_not_of(blanks, at), text.size());
}

} // namespace

class XmlMap::Parser {
  public:
    Parser(XmlMap& map) : m_map(map), m_parser(XML_ParserCreateNS(nullptr, ' '), XML_ParserFree) {
        if (m_parser == nullptr) {
            throw std::bad_alloc();
        }
        XML_SetUserData(m_parser.get(), this);
        XML_SetElementHandler(
            m_parser.get(),
            [](void* self, const XML_Char*, const XML_Char**) {
                static_cast<Parser*>(self)->start();
            },
            [](void* self, const XML_Char*) { static_cast<Parser*>(self)->end(); });
    }

    void run() {
        const std::string_view text = m_map.m_text;
        const auto result =
            XML_Parse(m_parser.get(), text.data(), static_cast<int>(text.size()), 1);
        if (m_map.hasTooManyElements()) {
            m_map.m_fault = "more than " + std::to_string(mostXmlElements) + " elements";
        } else if (result != XML_STATUS_OK) {
            m_map.m_fault = "line " + std::to_string(XML_GetCurrentLineNumber(m_parser.get())) +
                            ": " + XML_ErrorString(XML_GetErrorCode(m_parser.get()));
        }
    }

  private:
    std::size_t place() const {
        return static_cast<std::size_t>(XML_GetCurrentByteIndex(m_parser.get()));
    }

    void start() {
        XmlElement element;
        element.tag = place();
        element.tagEnd =
            element.tag + static_cast<std::size_t>(XML_GetCurrentByteCount(m_parser.get()));
        element.parent = m_open.empty() ? -1 : m_open.back();
        const std::string_view text = m_map.m_text;
        if (text[element.tag] == '<') { // An entity's elements are at its reference.
            const std::size_t name = element.tag + 1;
            element.name = text.substr(name, text.find_first_of(" \t\r\n/>", name) - name);
        }
        m_open.push_back(static_cast<int>(m_map.m_elements.size()));
        m_map.m_elements.push_back(element);
        if (m_map.hasTooManyElements()) {
            XML_StopParser(m_parser.get(), XML_FALSE);
        }
    }

    void end() {
        auto& element = m_map.m_elements[static_cast<std::size_t>(m_open.back())];
        m_open.pop_back();
        if (m_map.m_text[element.tagEnd - 2] != '/') {
            element.endTag = place();
        }
    }

    XmlMap& m_map;
    const std::unique_ptr<XML_ParserStruct, decltype(&XML_ParserFree)> m_parser;
    std::vector<int> m_open;
};

XmlMap::XmlMap(std::string_view text) : m_text(text) {
    Parser(*this).run();
}

const XmlElement* XmlMap::first(std::string_view name, const XmlElement* parent) const {
    const auto found =
        std::find_if(m_elements.begin(), m_elements.end(), [&](const XmlElement& element) {
            return element.name == name &&
                   (parent == nullptr || element.parent == parent - m_elements.data());
        });
    return found == m_elements.end() ? nullptr : &*found;
}

const XmlElement* XmlMap::withTagAround(std::size_t place) const {
    const auto next = std::upper_bound(
        m_elements.begin(), m_elements.end(), place,
        [](std::size_t wanted, const XmlElement& element) { return wanted < element.tag; });
    const bool isFound = next != m_elements.begin() && place < std::prev(next)->tagEnd;
    return isFound ? &*std::prev(next) : nullptr;
}

std::vector<XmlAttribute> XmlMap::attributesOf(const XmlElement& element) const {
    std::vector<XmlAttribute> attributes;
    const std::string_view tag = m_text.substr(0, element.tagEnd);
    XmlAttribute next;
    next.begin = element.tag + 1 + element.name.size();
    while (true) {
        next.nameBegin = skipBlanks(tag, next.begin);
        if (next.nameBegin == tag.size() || tag[next.nameBegin] == '/' ||
            tag[next.nameBegin] == '>') {
            return attributes;
        }
        const std::size_t nameEnd = tag.find_first_of(" \t\r\n=", next.nameBegin);
        next.name = tag.substr(next.nameBegin, nameEnd - next.nameBegin);
        next.value = tag.find_first_of("\"'", nameEnd) + 1;
        next.valueEnd = tag.find(tag[next.value - 1], next.value);
        next.end = next.valueEnd + 1;
        attributes.push_back(next);
        next.begin = next.end;
    }
}

} // namespace admin
