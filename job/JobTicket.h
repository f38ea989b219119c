// SPDX-License-Identifier: Apache-2.0
// One ticket of the server, as the job logic reads and writes it.
#pragma once

#include <string>

#include <wx/string.h>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "jobkeys/Tickets.h"

/// A view on the connector's reads and writes of one ticket, at the key as a whole.
///
/// Reads and writes of one value return the connector's code: 0, or another one that says that
/// nothing was found or done. It owns nothing and must not outlive the connector.
class JobTicket {
  public:
    JobTicket(CKZConnector* connector, int id, int type = jobkeys::jobType)
        : m_connector(connector), m_type(type), m_id(id) {}

    /// Where there is none, *value becomes the fallback.
    int read(const std::string& key, int fallback, int* value) const;

    /// The bytes of a text. Where there is none, *value is emptied.
    int read(const std::string& key, std::string* value) const;

    /// A reader of texts for the lookups of jobkeys. *code becomes that of its latest read.
    auto texts(int* code) const {
        return [this, code](const std::string& key) {
            std::string text;
            *code = read(key, &text);
            return text;
        };
    }

    /// A text as UTF-8; one that is not valid is empty. Where there is none, *value is emptied.
    int read(const std::string& key, wxString* value) const;

    /// At most `maximum` elements; returns how many were stored, 0 where there are none. Elements
    /// behind those are left as they were.
    int readArray(const std::string& key, int maximum, int* values) const;
    int readArray(const std::string& key, int maximum, double* values) const;

    int write(const std::string& key, int value) const;
    int write(const std::string& key, const std::string& value) const;

    /// Replaces the whole array. False if the plug-in did not take it.
    bool writeArray(const std::string& key, int count, const int* values) const;
    bool writeArray(const std::string& key, int count, const double* values) const;

  private:
    CKZConnector* m_connector;
    int m_type;
    int m_id;
};
