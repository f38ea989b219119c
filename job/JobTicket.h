// SPDX-License-Identifier: Apache-2.0
// One ticket of the server, as read and written by the job logic.
#pragma once

#include <string>

#include <wx/string.h>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "jobkeys/Tickets.h"

/// Reads and writes keys of one ticket through the connector, at POSITION_WHOLE.
///
/// Reads and writes of one value return the connector's code: 0, or another code if nothing was
/// found or done. The object owns nothing and must not outlive the connector.
class JobTicket {
  public:
    JobTicket(CKZConnector* connector, int id, int type = jobkeys::jobType)
        : m_connector(connector), m_type(type), m_id(id) {}

    /// If there is no value, *value becomes the fallback.
    int read(const std::string& key, int fallback, int* value) const;

    /// Reads a text as bytes. If there is none, empties *value.
    int read(const std::string& key, std::string* value) const;

    /// Returns a text reader for the lookups of jobkeys. *code becomes the code of the latest read.
    auto texts(int* code) const {
        return [this, code](const std::string& key) {
            std::string text;
            *code = read(key, &text);
            return text;
        };
    }

    /// Reads a text as UTF-8; invalid UTF-8 gives an empty text. If there is none, empties *value.
    int read(const std::string& key, wxString* value) const;

    /// Stores at most `maximum` elements and returns their number, 0 if there are none. The rest of
    /// the array is unchanged.
    int readArray(const std::string& key, int maximum, int* values) const;
    int readArray(const std::string& key, int maximum, double* values) const;

    int write(const std::string& key, int value) const;
    int write(const std::string& key, const std::string& value) const;

    /// Replaces the whole array. False if the plug-in refused it.
    bool writeArray(const std::string& key, int count, const int* values) const;
    bool writeArray(const std::string& key, int count, const double* values) const;

  private:
    CKZConnector* m_connector;
    int m_type;
    int m_id;
};
