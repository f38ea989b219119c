// SPDX-License-Identifier: Apache-2.0
#include "colour/CxfXml.h"

#include <algorithm>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstdint>

namespace colour::cxf {
namespace {

constexpr std::string_view versionMark = "CxF3"; ///< In the namespaces of all CxF 3 revisions.
constexpr std::string_view rootName = "CxF";

bool isBlank(char c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r';
}

std::string_view localName(std::string_view name) {
    return name.substr(name.find(':') + 1);
}

/// The first quote or ">" of a tag; checks eight bytes at a time.
const char* nextSign(const char* at, const char* end) {
    constexpr std::uint64_t ones = 0x0101010101010101;
    constexpr std::uint64_t tops = 0x8080808080808080;
    // The top bit of every zero byte, exact up to the first one.
    const auto zeros = [](std::uint64_t word) { return (word - ones) & ~word & tops; };
    while (std::endian::native == std::endian::little && end - at >= 8) {
        std::uint64_t word = 0;
        std::memcpy(&word, at, sizeof word);
        const std::uint64_t found =
            zeros(word ^ ones * '>') | zeros(word ^ ones * '"') | zeros(word ^ ones * '\'');
        if (found != 0) {
            return at + std::countr_zero(found) / 8;
        }
        at += sizeof word;
    }
    return std::find_if(at, end, [](char c) { return c == '>' || c == '"' || c == '\''; });
}

/// Iterates over tags and skips comments, CDATA sections and processing instructions. The parser
/// checks whether the text is well-formed.
class Tags {
  public:
    enum Kind { Start, End, Empty, Declaration, Broken, Nothing };

    explicit Tags(std::string_view text)
        : m_start(text.data()), m_at(m_start), m_end(m_start + text.size()) {}

    /// The next tag; `name` is the text after the "<" of a start tag. Declaration is a document
    /// type or similar.
    Kind next(std::string_view& name) {
        while (true) {
            const void* const found =
                m_at == m_end ? nullptr
                              : std::memchr(m_at, '<', static_cast<std::size_t>(m_end - m_at));
            if (found == nullptr) {
                return Nothing;
            }
            m_at = static_cast<const char*>(found) + 1;
            switch (m_at == m_end ? '\0' : *m_at) {
            case '\0':
                return Broken;
            case '/':
                return End;
            case '?':
                skipBehind("?>");
                break;
            case '!':
                if (!skipSection()) {
                    return Declaration;
                }
                break;
            default:
                return startTag(name);
            }
        }
    }

    /// The end of the last tag.
    std::size_t at() const { return static_cast<std::size_t>(m_at - m_start); }

  private:
    void skipBehind(std::string_view end) {
        const std::string_view rest(m_at, static_cast<std::size_t>(m_end - m_at));
        const std::size_t at = rest.find(end);
        m_at = at == rest.npos ? m_end : m_at + at + end.size();
    }

    /// Skips a comment or CDATA section; false if it is neither.
    bool skipSection() {
        const std::string_view rest(m_at, static_cast<std::size_t>(m_end - m_at));
        for (const auto& [begin, end] : {std::pair{"!--", "-->"}, std::pair{"![CDATA[", "]]>"}}) {
            if (rest.starts_with(begin)) {
                m_at += std::strlen(begin);
                skipBehind(end);
                return true;
            }
        }
        return false;
    }

    /// Moves to the tag's '>', ignoring any in quoted values.
    Kind startTag(std::string_view& name) {
        const char* const start = m_at;
        while ((m_at = nextSign(m_at, m_end)) != m_end && *m_at != '>') {
            const void* const closing =
                std::memchr(m_at + 1, *m_at, static_cast<std::size_t>(m_end - m_at - 1));
            if (closing == nullptr) {
                m_at = m_end;
                return Broken;
            }
            m_at = static_cast<const char*>(closing) + 1;
        }
        if (m_at == m_end) {
            return Broken;
        }
        name = {start, static_cast<std::size_t>(m_at - start)};
        return *m_at++ == '>' && m_at[-2] == '/' ? Empty : Start;
    }

    const char* m_start;
    const char* m_at;
    const char* m_end;
};

/// Checks before parsing. `endOfRootTag` is the end of the root's start tag, `elements` the number
/// of elements.
Failure checkStructure(std::string_view utf8, std::size_t& endOfRootTag, std::size_t& elements) {
    Tags tags(utf8);
    elements = 0;
    int depth = 0;
    std::string_view name;
    endOfRootTag = 0;
    while (true) {
        const Tags::Kind kind = tags.next(name);
        switch (kind) {
        case Tags::Declaration:
            return Failure::XmlRefused;
        case Tags::Broken:
            return Failure::Damaged;
        case Tags::Nothing:
            return Failure::None;
        case Tags::End:
            --depth;
            break;
        case Tags::Start:
        case Tags::Empty:
            if (++elements > maxElements) {
                return Failure::TooLarge;
            }
            if (elements == 1) {
                endOfRootTag = tags.at();
            }
            depth += kind == Tags::Start ? 1 : 0;
            if (depth > maxDepth) {
                return Failure::XmlRefused;
            }
            break;
        }
    }
}

/// The namespace bound to a prefix (with its colon, or empty) at a node.
std::string_view namespaceOf(pugi::xml_node node, std::string_view prefix) {
    std::string attribute = "xmlns";
    if (!prefix.empty()) {
        attribute += ':';
        attribute += prefix.substr(0, prefix.size() - 1);
    }
    for (; node; node = node.parent()) {
        if (const pugi::xml_attribute found = node.attribute(attribute.c_str())) {
            return found.value();
        }
    }
    return {};
}

std::size_t declarationsIn(std::string_view tag) {
    std::size_t count = 0;
    for (std::size_t at = tag.find("xmlns"); at != tag.npos; at = tag.find("xmlns", at + 5)) {
        const bool ofSchemas = tag.substr(at).starts_with("xmlns:xsi=");
        count += ofSchemas ? 0 : 1;
    }
    return count;
}

std::string_view prefixOf(std::string_view name) {
    return name.substr(0, name.size() - localName(name).size());
}

} // namespace

bool hasRoot(std::string_view utf8) {
    const auto start = std::find_if_not(utf8.begin(), utf8.end(), isBlank);
    if (start == utf8.end() || *start != '<') {
        return false;
    }
    Tags tags(utf8);
    std::string_view name;
    const Tags::Kind kind = tags.next(name);
    if (kind == Tags::Declaration) { // Refused later, with its own code.
        return utf8.find("<CxF") != utf8.npos || utf8.find(":CxF") != utf8.npos;
    }
    name = name.substr(0, name.find_first_of(" \t\r\n/"));
    return (kind == Tags::Start || kind == Tags::Empty) && localName(name) == rootName;
}

Failure Document::load(std::string_view utf8) {
    if (!hasRoot(utf8.substr(0, std::size_t{1} << 16))) {
        return Failure::NotRecognised;
    }
    if (utf8.size() > maxBytes) {
        return Failure::TooLarge;
    }
    std::size_t endOfRootTag = 0;
    if (const Failure failure = checkStructure(utf8, endOfRootTag, m_elementCount);
        failure != Failure::None) {
        return failure;
    }
    // Roots also declare the instance namespace of XML Schema, which no element uses.
    m_manyNamespaces = utf8.find("xmlns", endOfRootTag) != utf8.npos ||
                       declarationsIn(utf8.substr(0, endOfRootTag)) > 1;
    constexpr unsigned flags = pugi::parse_cdata | pugi::parse_escapes |
                               pugi::parse_wconv_attribute | pugi::parse_embed_pcdata;
    const pugi::xml_parse_result result =
        m_document.load_buffer(utf8.data(), utf8.size(), flags, pugi::encoding_auto);
    if (result.status == pugi::status_out_of_memory) {
        return Failure::OutOfMemory;
    }
    m_root = m_document.document_element();
    if (!result || !m_root || m_root.next_sibling()) {
        return Failure::Damaged;
    }
    const std::string_view name = m_root.name();
    m_prefix = prefixOf(name);
    m_namespace = namespaceOf(m_root, m_prefix);
    const bool known = m_namespace.empty() || m_namespace.find(versionMark) != m_namespace.npos;
    return localName(name) == rootName && known ? Failure::None : Failure::NotRecognised;
}

Name Document::name(std::string_view local) const {
    Name name;
    name.m_whole = m_prefix + std::string(local);
    name.m_local = local;
    return name;
}

bool Document::resolvesTo(pugi::xml_node node, const Name& name) const {
    const std::string_view whole = node.name();
    if (!whole.ends_with(name.m_local)) {
        return false;
    }
    const std::string_view prefix = whole.substr(0, whole.size() - name.m_local.size());
    return (prefix.empty() || prefix.back() == ':') && namespaceOf(node, prefix) == m_namespace;
}

pugi::xml_node Document::child(pugi::xml_node parent, const Name& name) const {
    pugi::xml_node node = parent.first_child();
    while (node && !is(node, name)) {
        node = node.next_sibling();
    }
    return node;
}

std::string_view textOf(pugi::xml_node element, std::string& storage) {
    if (!element.first_child()) {
        return element.value();
    }
    storage = element.value();
    for (const pugi::xml_node part : element.children()) {
        if (part.type() == pugi::node_pcdata || part.type() == pugi::node_cdata) {
            storage += part.value();
        }
    }
    return storage;
}

std::optional<double> numberOf(std::string_view text) {
    while (!text.empty() && isBlank(text.front())) {
        text.remove_prefix(1);
    }
    while (!text.empty() && isBlank(text.back())) {
        text.remove_suffix(1);
    }
    if (text.starts_with('+')) {
        text.remove_prefix(1);
    }
    double number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    const bool whole = error == std::errc() && end == text.data() + text.size();
    return whole && std::isfinite(number) ? std::optional(number) : std::nullopt;
}

} // namespace colour::cxf
