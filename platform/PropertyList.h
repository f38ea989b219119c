// SPDX-License-Identifier: Apache-2.0
// Property lists, in which the suite says where its parts are installed and bundles say what they
// offer. XML:
//
//   <plist version="1.0"><dict>
//     <key>Nerova Hue Workbench</key>
//     <dict><key>library_path</key><string>/opt/suite/library</string></dict>
//   </dict></plist>
//
// The binary form holds the same tree and begins with "bplist00".
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace platform {

/// A property list that was read whole. Texts are UTF-8.
class PropertyList {
  public:
    /// The way to a value, from the outside in: names of dictionary entries and, for arrays, the
    /// number of the element. The empty way leads to the outermost value.
    using Way = std::vector<std::string>;

    /// Nothing if there is no regular file at path, it is no property list, or libplist is not
    /// installed.
    static std::optional<PropertyList> read(const std::string& path);

    /// Whether a value of any kind stands there.
    bool exists(const Way& way) const;

    /// A value in one line of text: a string as it is, a number in decimal, true or false, a date
    /// as 2001-01-01T00:00:00Z. Nothing if it is missing, a collection or binary data.
    std::optional<std::string> text(const Way& way) const;

    /// The names of a dictionary's entries in their order; nothing if no dictionary stands there.
    std::optional<std::vector<std::string>> names(const Way& way) const;

    /// The number of an array's elements; nothing if no array stands there.
    std::optional<std::size_t> count(const Way& way) const;

  private:
    explicit PropertyList(void* root);
    void* find(const Way& way) const;

    std::shared_ptr<void> m_root; ///< libplist's tree.
};

} // namespace platform
