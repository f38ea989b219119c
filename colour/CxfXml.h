// XML of colour exchange files: checked before it is parsed, and its elements known by namespace.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include <pugixml.hpp>

#include "colour/Failure.h"

namespace colour::cxf {

/// Beyond these a file is refused. The parser's tree takes about 50 bytes for each element.
inline constexpr std::size_t maxBytes = std::size_t{1} << 30;
inline constexpr std::size_t maxElements = 20'000'000;
inline constexpr int maxDepth = 64; ///< The format needs about ten.

/// True if the root element is named CxF, in whatever namespace.
bool hasRoot(std::string_view utf8);

/// A parsed file. Nodes live as long as the document.
class Document {
  public:
    /// TooLarge, XmlRefused (a document type, or nested too deeply), Damaged (not well-formed),
    /// NotRecognised (another root, or a version of the format that is not known) or OutOfMemory.
    Failure load(std::string_view utf8);

    pugi::xml_node root() const { return m_root; }
    bool hasNamespace() const { return !m_namespace.empty(); }

    /// True for an element of this local name in the root's namespace.
    bool is(pugi::xml_node node, std::string_view name) const;
    /// The first such child; null if there is none.
    pugi::xml_node child(pugi::xml_node parent, std::string_view name) const;

    /// Calls `take(child)` for each child element in the root's namespace that has the local name.
    template<class Take>
    void forEach(pugi::xml_node parent, std::string_view name, const Take& take) const {
        for (pugi::xml_node node = parent.first_child(); node; node = node.next_sibling()) {
            if (is(node, name)) {
                take(node);
            }
        }
    }

  private:
    pugi::xml_document m_document;
    pugi::xml_node m_root;
    std::string m_prefix; ///< Of the root, with its colon.
    std::string m_namespace;
    bool m_redeclares = false; ///< An element below the root declares a namespace, too.
};

/// The whole text of an element: comments and CDATA sections split it into several nodes. The view
/// points into the document or into `storage`.
std::string_view textOf(pugi::xml_node element, std::string& storage);

/// The text as a finite number, blanks around it allowed; nothing for any other.
std::optional<double> numberOf(std::string_view text);

} // namespace colour::cxf
