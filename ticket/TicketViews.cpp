// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketViews.h"

#include <limits>

#include "ticket/TicketFilenames.h"

using ticket::Single;

bool STICKET_READ::ParameterExists(const char* key, int position) const {
    return Single(*this).get(key, PARAM_DELETE, nullptr, position);
}

bool STICKET_READ::GetParameter(const char* key, std::string& out, int position) const {
    return ticket::readString(Single(*this), key, out, position);
}

bool STICKET_READ::GetParameter(const char* key, int& out, int position) const {
    int value = out;
    if (!Single(*this).get(key, PARAM_INT, &value, position)) {
        return false;
    }
    out = value;
    return true;
}

int STICKET_READ::GetIntParameter(const char* key, int fallback) const {
    return ticket::readInt(Single(*this), key, fallback, POSITION_WHOLE);
}

std::string STICKET_READ::GetStringParameter(const char* key, const std::string& fallback) const {
    return ticket::readString(Single(*this), key, fallback);
}

bool STICKET_READ::GetFilenameParameterChk_C(const char* key, std::string& out,
                                             int position) const {
    return ticket::readFilename(Single(*this), key, out, position);
}

template<class V>
int STICKET_READ::FindParameterPosition(const char* key, const V& value) const {
    V element{};
    for (int position = 0; GetParameter(key, element, position); ++position) {
        if (element == value) {
            return position;
        }
        if (position == std::numeric_limits<int>::max()) {
            break;
        }
    }
    return -1;
}

template int STICKET_READ::FindParameterPosition(const char* key, const int& value) const;
template int STICKET_READ::FindParameterPosition(const char* key, const std::string& value) const;

bool STICKET_READ::GetFilenameVectorParameter_C(const char* key,
                                                std::vector<std::string>& out) const {
    return ticket::readFilenames(Single(*this), key, out);
}

bool STICKET_READ::WhoAmI(STICKET_OPTION_WHOAMI& out) const {
    if (ticket::bit0(ticket::single::Option::call(*this, STICKET_OPTION_CODE_WHOAMI, &out))) {
        return true;
    }
    out = {};
    return false;
}

bool STICKET_MODIFY::SetParameter(const char* key, void* value, int position) const {
    return xSetParameter(key, PARAM_POINTER, value, position);
}

bool STICKET_MODIFY::xSetParameter(const char* key, PARAM_TYPE type, const void* value,
                                   int position) const {
    return Single(*this).set(key, type, value, position);
}

bool STICKET_MODIFY::DelParameter(const char* key, int position) const {
    return xSetParameter(key, PARAM_DELETE, nullptr, position);
}

bool STICKET_MODIFY::SetMultiParameter(SETMULTIPAR* table) const {
    return Single(*this).set(table);
}

bool STICKET_MODIFY::SetFilenameVectorParameter(const char* key,
                                                const std::vector<std::string>& names) const {
    return ticket::writeFilenames(Single(*this), key, names);
}

bool STICKET_MODIFY::Assign(const STICKET_ACCESS* source, const char* const* keys) const {
    return ticket::bit0(ticket::single::Transfer::call(*this, source, keys, 1));
}

bool STICKET_MODIFY::Merge(const STICKET_ACCESS* source, const char* const* keys) const {
    return ticket::bit0(ticket::single::Transfer::call(*this, source, keys, 0));
}
