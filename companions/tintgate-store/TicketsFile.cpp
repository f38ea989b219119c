// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/TicketsFile.h"

#include <algorithm>
#include <istream>
#include <iterator>
#include <ostream>
#include <set>

#include "base/Utf8.h"
#include "companions/tintgate-store/ElementsJson.h"
#include "companions/tintgate-store/Failure.h"
#include "ticket/TicketRecords.h"

namespace admin {

namespace {

constexpr const char* formatName = "tintgate tickets";
constexpr int formatVersion = 1;

[[noreturn]] void refuse(const std::string& text) {
    throw Failure(Status::BadInput, text);
}

/// Rejects an object with a repeated member: JSON readers differ in which one they use. (The
/// parser's own callback could do this, but its time grows with the square of an object's size.)
class MemberCheck : public nlohmann::json_sax<Json> {
  public:
    bool null() override { return true; }
    bool boolean(bool) override { return true; }
    bool number_integer(number_integer_t) override { return true; }
    bool number_unsigned(number_unsigned_t) override { return true; }
    bool number_float(number_float_t, const string_t&) override { return true; }
    bool string(string_t&) override { return true; }
    bool binary(binary_t&) override { return true; }
    bool start_array(std::size_t) override { return true; }
    bool end_array() override { return true; }
    bool start_object(std::size_t) override {
        m_members.emplace_back();
        return true;
    }
    bool end_object() override {
        m_members.pop_back();
        return true;
    }
    bool key(string_t& name) override {
        if (!m_members.back().insert(name).second) {
            refuse("\"" + printable(name) + "\" is repeated");
        }
        return true;
    }
    bool parse_error(std::size_t, const std::string&, const Json::exception& failure) override {
        const std::string text = failure.what();
        refuse("not JSON: " + printable(text.substr(std::min(text.size(), text.find("] ") + 2))));
    }

  private:
    std::vector<std::set<std::string>> m_members;
};

Json parse(std::istream& from) {
    const std::string text{std::istreambuf_iterator<char>(from), {}};
    MemberCheck check;
    Json::sax_parse(text, &check);
    return Json::parse(text);
}

/// Rejects members that are not in the list.
void allow(const Json& object, const std::set<std::string>& names, const std::string& what) {
    if (!object.is_object()) {
        refuse(what + " is not an object");
    }
    for (const auto& [name, member] : object.items()) {
        if (names.count(name) == 0) {
            refuse(what + " has an unknown member \"" + printable(name) + "\"");
        }
    }
}

/// An integer within its limits, or -1.
int numberAt(const Json& object, const char* name, int highest) {
    if (!object.contains(name) || !object[name].is_number_integer()) {
        return -1;
    }
    const auto number = object[name].get<std::int64_t>();
    return number < 0 || number > highest ? -1 : static_cast<int>(number);
}

void putKey(NamedTicket& ticket, const std::string& key, const Json& elements) {
    const std::string where = textOf(ticket.name) + ", key \"" + printable(key) + "\": ";
    if (key.empty() || key.back() == '*' || key.find('\0') != std::string::npos) {
        refuse(where + "a key must not be empty, end in * or contain a zero byte");
    }
    if (ticket.content.find(key)) {
        refuse(where + "it is repeated");
    }
    try {
        ticket.content.put(key, elementsFromJson(elements));
    } catch (const Failure& failure) {
        refuse(where + failure.what());
    }
}

NamedTicket ticketFrom(const Json& json) {
    allow(json, {"type", "id", "keys", "byteKeys"}, "a ticket");
    NamedTicket ticket;
    ticket.name = {numberAt(json, "type", 0xFFFF), numberAt(json, "id", 0xFFFFFFF)};
    if (!TICKET_Valid(ticket.name.type, ticket.name.id)) {
        refuse("a ticket's type must be 0 to 49 and its id 0 to 16777215");
    }
    if (!json.contains("keys")) {
        refuse(textOf(ticket.name) + " has no \"keys\"");
    }
    for (const char* const name : {"keys", "byteKeys"}) {
        if (json.contains(name) && !json[name].is_object()) {
            refuse(textOf(ticket.name) + ": \"" + name + "\" is not an object");
        }
    }
    for (const auto& [key, elements] : json["keys"].items()) {
        putKey(ticket, key, elements);
    }
    if (json.contains("byteKeys")) {
        for (const auto& [text, elements] : json["byteKeys"].items()) {
            const auto key = fromBase64(text);
            if (!key) {
                refuse(textOf(ticket.name) + ": \"" + printable(text) + "\" is not base64");
            }
            putKey(ticket, *key, elements);
        }
    }
    return ticket;
}

std::string inOneLine(const Json& json) {
    return json.dump(-1, ' ', true);
}

} // namespace

std::vector<NamedTicket> readTickets(std::istream& from) {
    const Json file = parse(from);
    if (!file.is_object() || file.value("format", Json()) != formatName) {
        refuse(std::string("\"format\" is not \"") + formatName + "\"");
    }
    if (numberAt(file, "version", formatVersion) != formatVersion) {
        refuse("\"version\" is not " + std::to_string(formatVersion));
    }
    allow(file, {"format", "version", "tickets"}, "the file");
    if (!file.contains("tickets") || !file["tickets"].is_array()) {
        refuse("\"tickets\" is not a list");
    }
    std::vector<NamedTicket> tickets;
    std::set<TicketName> seen;
    for (const auto& json : file["tickets"]) {
        tickets.push_back(ticketFrom(json));
        if (!seen.insert(tickets.back().name).second) {
            refuse(textOf(tickets.back().name) + " is repeated");
        }
    }
    return tickets;
}

TicketsWriter::TicketsWriter(std::ostream& to) : m_to(to) {
    m_to << "{\n  \"format\": " << inOneLine(formatName) << ",\n  \"version\": " << formatVersion
         << ",\n  \"tickets\": [";
}

void TicketsWriter::add(const TicketName& name, const store::TicketContent& content) {
    m_to << (m_first ? "\n" : ",\n") << "    {\n      \"type\": " << name.type
         << ",\n      \"id\": " << name.id;
    m_first = false;
    for (const bool utf8 : {true, false}) {
        std::string lines;
        for (const auto& [key, elements] : content.keys()) {
            if (base::isUtf8(key) == utf8) {
                lines += (lines.empty() ? "\n        " : ",\n        ") +
                         inOneLine(utf8 ? key : toBase64(key)) + ": " +
                         inOneLine(elementsJson(*elements));
            }
        }
        if (utf8 || !lines.empty()) {
            m_to << ",\n      \"" << (utf8 ? "keys" : "byteKeys") << "\": {" << lines
                 << (lines.empty() ? "}" : "\n      }");
        }
    }
    m_to << "\n    }";
}

void TicketsWriter::finish() {
    m_to << (m_first ? "]\n}\n" : "\n  ]\n}\n");
}

} // namespace admin
