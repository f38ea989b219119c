// SPDX-License-Identifier: Apache-2.0
// Whether a file is well-formed XML.
#pragma once

#include <optional>
#include <ostream>
#include <streambuf>
#include <string>

#include <expat.h>

namespace admin {

/// A stream that judges what is written to it, of any size. Namespaces count: a prefix that stands
/// for none is a fault, since few readers take such a file. Nothing outside the file is read.
class XmlCheck : private std::streambuf {
  public:
    XmlCheck();
    ~XmlCheck() override;
    XmlCheck(const XmlCheck&) = delete;
    XmlCheck& operator=(const XmlCheck&) = delete;

    std::ostream& stream() { return m_stream; }

    /// Whether the content starts as XML does.
    bool looksLikeXml() const { return m_firstByte == '<'; }

    /// Once all is written, and once only: empty where it is well-formed, else the fault and its
    /// line.
    std::string fault();

  private:
    int_type overflow(int_type byte) override;
    std::streamsize xsputn(const char* bytes, std::streamsize count) override;
    void parse(const char* bytes, int count, bool last);

    XML_Parser m_parser;
    std::ostream m_stream;
    std::string m_fault;
    char m_firstByte = '\0'; ///< That is neither blank nor part of a byte order mark.
};

/// Whether the name is that of an XML file, such as a JDF.
bool isXmlName(const std::string& path);

} // namespace admin
