// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketFilenames.h"

#include "text/CharSets.h"

std::string FilenameToTicket(const std::string& name) {
    std::string result = name;
    CharSets::DBCS::ReplaceAll(result, '\\', '/');
    return result;
}

std::string FilenameFromTicket_C(const std::string& name) {
    return FilenameToTicket(name);
}

void FilenamesToTicket(std::vector<std::string>& out, const std::vector<std::string>& in) {
    out.clear();
    out.reserve(in.size());
    for (const std::string& name : in) {
        out.push_back(FilenameToTicket(name));
    }
}
