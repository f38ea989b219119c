// SPDX-License-Identifier: Apache-2.0
// Property lists. They describe where the suite's parts are installed and what bundles offer. XML:
//
//   <plist version="1.0"><dict>
//     <key>Nerova Hue Workbench</key>
//     <dict><key>library_path</key><string>/opt/suite/library</string></dict>
//   </dict></plist>
//
// The binary form contains the same tree and begins with "bplist00".
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace platform {

/// A property list, read completely. Texts are UTF-8.
class PropertyList {
  public:
    /// The path to a value, from the outside in: names of dictionary entries and, for arrays, the
    /// index of the element. An empty path means the outermost value.
    using Way = std::vector<std::string>;

    /// Nothing if there is no regular file at the path, it is not a property list, or libplist is
    /// not installed.
    static std::optional<PropertyList> read(const std::string& path);

    /// Whether there is a value of any kind.
    bool exists(const Way& way) const;

    /// A value as one line of text: a string unchanged, a number in decimal, true or false, a date
    /// as 2001-01-01T00:00:00Z. Nothing if it is missing, a collection or binary data.
    std::optional<std::string> text(const Way& way) const;

    /// The entry names of a dictionary in their order. Nothing if it is not a dictionary.
    std::optional<std::vector<std::string>> names(const Way& way) const;

    /// The number of elements of an array. Nothing if it is not an array.
    std::optional<std::size_t> count(const Way& way) const;

  private:
    explicit PropertyList(void* root);
    void* find(const Way& way) const;

    std::shared_ptr<void> m_root; ///< libplist's tree.
};

} // namespace platform
