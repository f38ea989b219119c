// SPDX-License-Identifier: Apache-2.0
// The places of an XML document's elements in its text, for changes that leave all else as it is.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace admin {

/// Places are offsets into the text.
struct XmlElement {
    std::string_view name; ///< As it is written, with its prefix; empty for what an entity brings.
    std::size_t tag = 0;   ///< Of the start tag.
    std::size_t tagEnd = 0;
    std::size_t endTag = 0; ///< 0 where the start tag is an empty one (<a/>).
    int parent = -1;        ///< Index of the element that it is in.

    bool hasEmptyTag() const { return endTag == 0; }
};

struct XmlAttribute {
    std::string_view name;
    std::size_t begin = 0; ///< Of the blanks in front of it.
    std::size_t nameBegin = 0;
    std::size_t value = 0; ///< Behind the opening quote.
    std::size_t valueEnd = 0;
    std::size_t end = 0; ///< Behind the closing quote.
};

/// Of a document that is worked on. A map of so many takes about 200 MB.
inline constexpr std::size_t mostXmlElements = 2'000'000;

class XmlMap {
  public:
    /// The text must outlive this, and have less than 2 GiB. Namespaces count, as in XmlCheck.
    explicit XmlMap(std::string_view text);

    /// Empty where the text is well-formed; else the fault and its line, and the elements before it
    /// are there.
    const std::string& fault() const { return m_fault; }

    /// The text has more than mostXmlElements, which is a fault too.
    bool hasTooManyElements() const { return m_elements.size() > mostXmlElements; }

    /// In the order of their start tags.
    const std::vector<XmlElement>& elements() const { return m_elements; }

    /// Null where there is none. With a parent: only a child of this element.
    const XmlElement* first(std::string_view name, const XmlElement* parent = nullptr) const;

    /// The element whose start tag contains this place; null if there is none.
    const XmlElement* withTagAround(std::size_t place) const;

    /// Of an element with a name.
    std::vector<XmlAttribute> attributesOf(const XmlElement& element) const;

  private:
    class Parser;

    std::string_view m_text;
    std::vector<XmlElement> m_elements;
    std::string m_fault;
};

} // namespace admin
