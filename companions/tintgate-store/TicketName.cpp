// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/TicketName.h"

#include <charconv>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Failure.h"
#include "ticket/TicketRecords.h"

namespace admin {

namespace {

const struct {
    const char* word;
    int type;
} knownTypes[] = {{"system", jobkeys::systemType}, {"job", jobType}, {"preset", presetType}};

constexpr int highestType = 49;
constexpr int highestId = 0xFFFFFF;
static_assert(TICKET_TYPE_Valid(highestType) && !TICKET_TYPE_Valid(highestType + 1));
static_assert(TICKET_ID_Valid(highestId) && !TICKET_ID_Valid(highestId + 1));

} // namespace

int wholeNumber(const std::string& text, int lowest, int highest, const std::string& what) {
    int number = 0;
    const char* const end = text.data() + text.size();
    const auto [stopped, error] = std::from_chars(text.data(), end, number);
    if (error != std::errc() || stopped != end || number < lowest || number > highest) {
        throw Failure(Status::BadInput, "\"" + printable(text) + "\" is no " + what +
                                            ": it is a "
                                            "whole number from " +
                                            std::to_string(lowest) + " to " +
                                            std::to_string(highest));
    }
    return number;
}

int typeNamed(const std::string& text) {
    for (const auto& [word, type] : knownTypes) {
        if (text == word) {
            return type;
        }
    }
    return wholeNumber(text, 0, highestType, "type of a ticket (job, preset, system)");
}

TicketName ticketNamed(const std::string& text) {
    if (text == "system") {
        return {};
    }
    const std::size_t slash = text.find('/');
    if (slash == std::string::npos) {
        throw Failure(Status::BadInput, "\"" + printable(text) +
                                            "\" names no ticket: say job/7, preset/1, system or "
                                            "TYPE/ID");
    }
    return {typeNamed(text.substr(0, slash)),
            wholeNumber(text.substr(slash + 1), 0, highestId, "id of a ticket")};
}

int jobNumber(const std::string& text) {
    const TicketName name =
        text.find('/') != std::string::npos ? ticketNamed(text) : ticketNamed("job/" + text);
    if (name.type != jobType) {
        throw Failure(Status::BadInput, textOf(name) + " is not a job");
    }
    return name.id;
}

std::string textOf(const TicketName& name) {
    if (name == TicketName{}) {
        return "system";
    }
    const std::string id = "/" + std::to_string(name.id);
    for (const auto& [word, type] : knownTypes) {
        if (name.type == type && type != 0) {
            return word + id;
        }
    }
    return std::to_string(name.type) + id;
}

} // namespace admin
