// SPDX-License-Identifier: Apache-2.0
// The positions of an XML document's elements in its text, for changes that keep everything else.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace admin {

/// Positions are offsets into the text.
struct XmlElement {
    std::string_view name; ///< As written, with its prefix; empty if from an entity.
    std::size_t tag = 0;   ///< Start of the start tag.
    std::size_t tagEnd = 0;
    std::size_t endTag = 0; ///< 0 if the start tag is an empty tag (<a/>).
    int parent = -1;        ///< Index of the parent element.

    bool hasEmptyTag() const { return endTag == 0; }
};

struct XmlAttribute {
    std::string_view name;
    std::size_t begin = 0; ///< Start of the preceding blanks.
    std::size_t nameBegin = 0;
    std::size_t value = 0; ///< After the opening quote.
    std::size_t valueEnd = 0;
    std::size_t end = 0; ///< After the closing quote.
};

/// Limit of a document. Its map takes about 200 MB.
inline constexpr std::size_t mostXmlElements = 2'000'000;

class XmlMap {
  public:
    /// The text must outlive this and be below 2 GiB. Namespaces are checked, as in XmlCheck.
    explicit XmlMap(std::string_view text);

    /// Empty if the text is well-formed. Otherwise the error and its line; the elements before it
    /// are available.
    const std::string& fault() const { return m_fault; }

    /// The text has more than mostXmlElements elements, which is an error too.
    bool hasTooManyElements() const { return m_elements.size() > mostXmlElements; }

    /// In the order of their start tags.
    const std::vector<XmlElement>& elements() const { return m_elements; }

    /// Null if there is none. With a parent, only its children.
    const XmlElement* first(std::string_view name, const XmlElement* parent = nullptr) const;

    /// The element whose start tag contains this position, or null.
    const XmlElement* withTagAround(std::size_t place) const;

    /// For an element with a name.
    std::vector<XmlAttribute> attributesOf(const XmlElement& element) const;

  private:
    class Parser;

    std::string_view m_text;
    std::vector<XmlElement> m_elements;
    std::string m_fault;
};

} // namespace admin
