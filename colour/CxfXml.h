// SPDX-License-Identifier: Apache-2.0
// XML of colour exchange files, checked before it is parsed. Elements are identified by namespace.
#pragma once

#include <cstring>
#include <optional>
#include <string>
#include <string_view>

#include <pugixml.hpp>

#include "colour/Failure.h"

namespace colour::cxf {

/// A file above these limits is refused. The parser's tree takes about 50 bytes per element.
inline constexpr std::size_t maxBytes = std::size_t{1} << 30;
inline constexpr std::size_t maxElements = 20'000'000;
inline constexpr int maxDepth = 64; ///< The format needs about ten.

/// True if the root element is named CxF, in any namespace.
bool hasRoot(std::string_view utf8);

/// An element's name as spelled in one document. Created once and compared often.
class Name {
  private:
    friend class Document;
    std::string m_whole; ///< Includes the root's prefix.
    std::string_view m_local;
};

/// A parsed file. Nodes live as long as the document.
class Document {
  public:
    /// Fails with TooLarge, XmlRefused (a document type, or too deep nesting), Damaged (not
    /// well-formed), NotRecognised (another root, or unknown version) or OutOfMemory.
    Failure load(std::string_view utf8);

    pugi::xml_node root() const { return m_root; }
    std::size_t elementCount() const { return m_elementCount; }
    bool hasNamespace() const { return !m_namespace.empty(); }

    /// `local` must outlive the name.
    Name name(std::string_view local) const;

    /// True for an element of this local name in the root's namespace.
    bool is(pugi::xml_node node, const Name& name) const {
        const bool same = std::strcmp(node.name(), name.m_whole.c_str()) == 0;
        return m_manyNamespaces ? resolvesTo(node, name) : same;
    }
    /// The first such child, or null.
    pugi::xml_node child(pugi::xml_node parent, const Name& name) const;
    pugi::xml_node child(pugi::xml_node parent, std::string_view local) const {
        return child(parent, name(local));
    }

    /// Calls `take(child)` for each child element with this local name in the root's namespace.
    template<class Take>
    void forEach(pugi::xml_node parent, std::string_view local, const Take& take) const {
        forEach(parent, name(local), take);
    }
    template<class Take>
    void forEach(pugi::xml_node parent, const Name& name, const Take& take) const {
        for (pugi::xml_node node = parent.first_child(); node; node = node.next_sibling()) {
            if (is(node, name)) {
                take(node);
            }
        }
    }

  private:
    bool resolvesTo(pugi::xml_node node, const Name& name) const;

    pugi::xml_document m_document;
    pugi::xml_node m_root;
    std::size_t m_elementCount = 0;
    std::string m_prefix; ///< The root's prefix with its colon.
    std::string m_namespace;
    bool m_manyNamespaces = false; ///< There is more than one namespace declaration.
};

/// The whole text of an element, which comments and CDATA sections split into several nodes. The
/// view points into the document or into `storage`.
std::string_view textOf(pugi::xml_node element, std::string& storage);

/// The text as a finite number, with optional blanks around it. Nothing for any other text.
std::optional<double> numberOf(std::string_view text);

} // namespace colour::cxf
