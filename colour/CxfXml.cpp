#include "colour/CxfXml.h"

#include <algorithm>
#include <charconv>
#include <cmath>

namespace colour::cxf {
namespace {

constexpr std::string_view versionMark = "CxF3"; ///< In the namespace of all revisions of CxF 3.
constexpr std::string_view rootName = "CxF";

bool isBlank(char c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r';
}

std::string_view localName(std::string_view name) {
    return name.substr(name.find(':') + 1);
}

/// Goes from tag to tag, past comments, CDATA sections and processing instructions.
class Tags {
  public:
    enum Kind { Start, End, Empty, Declaration, Broken, Nothing };

    explicit Tags(std::string_view text) : m_text(text) {}

    /// The next tag; `name` is that of a start. Declaration is a document type and its like.
    Kind next(std::string_view& name) {
        while (true) {
            const std::size_t at = m_text.find('<', m_at);
            if (at == m_text.npos) {
                return Nothing;
            }
            const std::string_view rest = m_text.substr(at);
            if (rest.starts_with("<!--")) {
                skipTo("-->", at + 4);
            } else if (rest.starts_with("<![CDATA[")) {
                skipTo("]]>", at + 9);
            } else if (rest.starts_with("<?")) {
                skipTo("?>", at + 2);
            } else if (rest.starts_with("<!")) {
                return Declaration;
            } else {
                return tagAt(at, name);
            }
        }
    }

    /// Where the last tag ended.
    std::size_t at() const { return m_at; }

  private:
    void skipTo(std::string_view end, std::size_t from) {
        const std::size_t at = m_text.find(end, from);
        m_at = at == m_text.npos ? m_text.size() : at + end.size();
    }

    Kind tagAt(std::size_t start, std::string_view& name) {
        std::size_t at = start + 1;
        const bool isEnd = at < m_text.size() && m_text[at] == '/';
        char quote = 0;
        for (; at < m_text.size() && (quote != 0 || m_text[at] != '>'); ++at) {
            const char c = m_text[at];
            if (c == quote) {
                quote = 0;
            } else if (quote == 0 && (c == '"' || c == '\'')) {
                quote = c;
            }
        }
        m_at = std::min(at + 1, m_text.size());
        if (at == m_text.size()) {
            return Broken;
        }
        if (isEnd) {
            return End;
        }
        const std::size_t end = m_text.find_first_of(" \t\r\n/>", start + 1);
        name = m_text.substr(start + 1, end - start - 1);
        return m_text[at - 1] == '/' ? Empty : Start;
    }

    std::string_view m_text;
    std::size_t m_at = 0;
};

/// What must be known before a parser makes a tree of it. `endOfRootTag` is where the start tag of
/// the root ends.
Failure checkStructure(std::string_view utf8, std::size_t& endOfRootTag) {
    Tags tags(utf8);
    std::size_t elements = 0;
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

/// The namespace that a prefix (with its colon; empty for none) is bound to at a node.
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
    if (kind == Tags::Declaration) { // Refused later, with a code of its own.
        return utf8.find("<CxF") != utf8.npos || utf8.find(":CxF") != utf8.npos;
    }
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
    if (const Failure failure = checkStructure(utf8, endOfRootTag); failure != Failure::None) {
        return failure;
    }
    m_redeclares = utf8.find("xmlns", endOfRootTag) != utf8.npos;
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

bool Document::is(pugi::xml_node node, std::string_view name) const {
    const std::string_view whole = node.name();
    if (!whole.ends_with(name)) {
        return false;
    }
    const std::string_view prefix = whole.substr(0, whole.size() - name.size());
    if (prefix == m_prefix && !m_redeclares) {
        return true;
    }
    return (prefix.empty() || prefix.back() == ':') && namespaceOf(node, prefix) == m_namespace;
}

pugi::xml_node Document::child(pugi::xml_node parent, std::string_view name) const {
    for (pugi::xml_node node = parent.first_child(); node; node = node.next_sibling()) {
        if (is(node, name)) {
            return node;
        }
    }
    return {};
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
