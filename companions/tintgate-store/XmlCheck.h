// SPDX-License-Identifier: Apache-2.0
// Checks whether a file is well-formed XML.
#pragma once

#include <optional>
#include <ostream>
#include <streambuf>
#include <string>

#include <expat.h>

namespace admin {

/// A stream that checks what is written to it, of any size. An undeclared namespace prefix is an
/// error, because few readers accept it. Reads nothing outside the file.
class XmlCheck : private std::streambuf {
  public:
    XmlCheck();
    ~XmlCheck() override;
    XmlCheck(const XmlCheck&) = delete;
    XmlCheck& operator=(const XmlCheck&) = delete;

    std::ostream& stream() { return m_stream; }

    /// Whether the content starts like XML.
    bool looksLikeXml() const { return m_firstByte == '<'; }

    /// Call once, after everything is written. Empty if the content is well-formed, otherwise the
    /// error and its line.
    std::string fault();

  private:
    int_type overflow(int_type byte) override;
    std::streamsize xsputn(const char* bytes, std::streamsize count) override;
    void parse(const char* bytes, int count, bool last);

    XML_Parser m_parser;
    std::ostream m_stream;
    std::string m_fault;
    char m_firstByte = '\0'; ///< The first byte other than blanks and byte order marks.
};

/// Whether the name is that of an XML file, such as a JDF.
bool isXmlName(const std::string& path);

} // namespace admin
