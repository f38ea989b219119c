// SPDX-License-Identifier: Apache-2.0
#include "job/JobTicket.h"

#include <cstdint>

namespace {

/// The connector takes an int's fallback as the value of the pointer itself.
void* fallbackOf(int value) {
    return reinterpret_cast<void*>(static_cast<std::intptr_t>(value));
}

} // namespace

int JobTicket::read(const std::string& key, int fallback, int* value) const {
    return m_connector->GetJobTicketKeyValue(m_type, m_id, key.c_str(), PARAM_INT, value,
                                             fallbackOf(fallback), POSITION_WHOLE);
}

int JobTicket::read(const std::string& key, std::string* value) const {
    const char* text = nullptr;
    const int result = m_connector->GetJobTicketKeyValue(m_type, m_id, key.c_str(), PARAM_STRING,
                                                         &text, nullptr, POSITION_WHOLE);
    value->assign(text == nullptr ? "" : text);
    return result;
}

int JobTicket::read(const std::string& key, wxString* value) const {
    std::string bytes;
    const int result = read(key, &bytes);
    *value = wxString::FromUTF8(bytes);
    return result;
}

int JobTicket::readArray(const std::string& key, int maximum, int* values) const {
    int count = 0;
    m_connector->GetJobTicketKeyArrayValues(m_type, m_id, key.c_str(), PARAM_INT, maximum, &count,
                                            values);
    return count;
}

int JobTicket::readArray(const std::string& key, int maximum, double* values) const {
    int count = 0;
    m_connector->GetJobTicketKeyArrayValues(m_type, m_id, key.c_str(), PARAM_DOUBLE, maximum,
                                            &count, values);
    return count;
}

int JobTicket::write(const std::string& key, int value) const {
    return m_connector->SetJobTicketKeyValue(m_type, m_id, key.c_str(), PARAM_INT, &value,
                                             POSITION_WHOLE);
}

int JobTicket::write(const std::string& key, const std::string& value) const {
    return m_connector->SetJobTicketKeyValue(m_type, m_id, key.c_str(), PARAM_STRING,
                                             const_cast<char*>(value.c_str()), POSITION_WHOLE);
}

bool JobTicket::writeArray(const std::string& key, int count, const int* values) const {
    return m_connector->SetJobArrayParameter(m_type, m_id, key.c_str(), PARAM_INT, count,
                                             const_cast<int*>(values));
}

bool JobTicket::writeArray(const std::string& key, int count, const double* values) const {
    return m_connector->SetJobArrayParameter(m_type, m_id, key.c_str(), PARAM_DOUBLE, count,
                                             const_cast<double*>(values));
}
