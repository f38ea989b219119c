// SPDX-License-Identifier: Apache-2.0
#include <iostream>
#include <iterator>

#include <unistd.h>

#include "base/Utf8.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/ElementsJson.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/LocalFile.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/TicketName.h"

namespace admin {

namespace {

struct KeyOptions {
    std::string ticket;
    std::string key;
    std::string type;
    std::vector<std::string> values;
    std::string from;
    std::string position; ///< Empty means the whole key.
    bool append = false;
    bool raw = false;

    int at() const {
        return position.empty() ? POSITION_WHOLE
                                : wholeNumber(position, 0, store::highestPosition, "position");
    }
};

[[noreturn]] void noSuchTicket(const TicketName& name) {
    throw Failure(Status::NotThere, "there is no ticket " + textOf(name));
}

[[noreturn]] void noSuchKey(const TicketName& name, const std::string& key) {
    throw Failure(Status::NotThere, textOf(name) + " has no key " + printable(key));
}

/// Types in order, without adjacent repeats: "int", "int string".
std::string typesOf(const store::Elements& elements) {
    std::string words;
    PARAM_TYPE last = PARAM_DELETE;
    elements.visit([&](int, const store::Value& value) {
        if (store::typeOf(value) != last) {
            last = store::typeOf(value);
            words += (words.empty() ? "" : " ") + std::string(typeWord(last));
        }
        return words.size() < 40;
    });
    return words;
}

std::string shortText(const store::Elements& elements) {
    constexpr std::size_t longest = 50;
    std::string text;
    elements.visit([&](int, const store::Value& value) {
        const bool binary = std::holds_alternative<store::Binary>(value);
        const std::string shown = valueText(value);
        text += (text.empty() ? "" : ", ") +
                (binary ? "(" + std::to_string(shown.size()) + " bytes)" : shown);
        return text.size() <= longest;
    });
    if (text.size() > longest) {
        text = std::string(base::cutUtf8(text, longest)) + "...";
    }
    return text;
}

void list(const Invocation& invocation, const KeyOptions& options) {
    const TicketName name = ticketNamed(options.ticket);
    const std::string prefix = options.key + "*";
    const char* const table[] = {prefix.c_str(), nullptr};
    const auto content = invocation.open()->content(
        name.type, name.id, store::KeyFilter(options.key.empty() ? nullptr : table));
    if (!content) {
        noSuchTicket(name);
    }
    std::vector<Row> rows;
    for (const auto& [key, elements] : content->keys()) {
        Row row{
            {"key", textOrBytes(key)}, {"types", typesOf(*elements)}, {"count", elements->count()}};
        if (invocation.json) {
            row["elements"] = elementsJson(*elements);
        } else {
            row["value"] = shortText(*elements);
        }
        rows.push_back(row);
    }
    showRows({{"key", "KEY"}, {"types", "TYPE"}, {"count", "COUNT"}, {"value", "VALUE"}}, rows,
             invocation.json);
}

/// The requested elements: one, or all.
std::shared_ptr<const store::Elements> wanted(const Invocation& invocation,
                                              const KeyOptions& options) {
    const TicketName name = ticketNamed(options.ticket);
    const int position = options.at();
    const auto store = invocation.open();
    auto all = store->key(name.type, name.id, options.key);
    if (!all) {
        store->exists(name.type, name.id) ? noSuchKey(name, options.key) : noSuchTicket(name);
    }
    if (position == POSITION_WHOLE) {
        return all;
    }
    const auto* value = all->at(position);
    if (value == nullptr) {
        throw Failure(Status::NotThere, printable(options.key) + " has nothing at position " +
                                            std::to_string(position));
    }
    auto one = std::make_shared<store::Elements>();
    one->put(0, *value);
    return one;
}

void get(const Invocation& invocation, const KeyOptions& options) {
    const auto elements = wanted(invocation, options);
    if (options.raw) {
        if (elements->filled() != 1) {
            throw Failure(Status::BadInput, "--raw is for one element: say its --position");
        }
        std::cout << valueText(*elements->first());
        return;
    }
    if (invocation.json) {
        std::cout << elementsJson(*elements).dump(-1, ' ', true) << '\n';
        return;
    }
    // Stored data must not control a terminal, but scripts need the bytes.
    const bool escapes = isatty(STDOUT_FILENO) != 0;
    int next = 0;
    elements->visit([&](int position, const store::Value& value) {
        if (position != next) {
            std::cerr << "(nothing from " << next << " to " << position - 1 << ")\n";
        }
        const bool binary = std::holds_alternative<store::Binary>(value);
        const std::string text = binary ? toBase64(valueText(value)) : valueText(value);
        std::cout << (escapes ? printable(text) : text) << '\n';
        next = position + 1;
        return true;
    });
}

std::vector<store::Value> givenValues(const KeyOptions& options, PARAM_TYPE type) {
    if (options.from.empty() == options.values.empty()) {
        throw Failure(Status::BadCommand, "give the values, or --from with a file");
    }
    std::vector<store::Value> values;
    if (options.from.empty()) {
        for (const auto& text : options.values) {
            values.push_back(valueFromText(type, text));
        }
        return values;
    }
    LocalInput input(options.from);
    const std::string bytes{std::istreambuf_iterator<char>(input.stream()), {}};
    values.push_back(valueFromText(type, type == PARAM_BINARY ? toBase64(bytes) : bytes));
    return values;
}

/// Appends values, sets them at a position, or replaces all values.
void putValues(store::TicketContent& content, const KeyOptions& options,
               std::vector<store::Value>& values, int position) {
    auto elements = std::make_shared<store::Elements>();
    const auto stored = content.find(options.key);
    if (stored && (options.append || position != POSITION_WHOLE)) {
        *elements = *stored;
    }
    std::int64_t next = options.append ? elements->count() : std::max(position, 0);
    if (next + static_cast<std::int64_t>(values.size()) > store::highestPosition + 1LL) {
        throw Failure(Status::BadInput, "there are more elements than a key can have");
    }
    for (auto& value : values) {
        elements->put(static_cast<int>(next++), std::move(value));
    }
    content.put(options.key, elements);
}

void set(const Invocation& invocation, const KeyOptions& options) {
    const TicketName name = ticketNamed(options.ticket);
    const int position = options.at();
    const PARAM_TYPE type = typeOfWord(options.type);
    if (type == PARAM_DELETE) {
        throw Failure(Status::BadInput, "\"" + printable(options.type) +
                                            "\" is not a type: int, uint, int64, uint64, double, "
                                            "string, binary or pointer");
    }
    if (options.key.empty() || options.key.back() == '*') {
        throw Failure(Status::BadInput, "a key must not be empty or end in *");
    }
    auto values = givenValues(options, type);
    store::Scope scope;
    scope.keys.emplace(options.key, options.append || position != POSITION_WHOLE);
    if (!invocation.open()->change(name.type, name.id, scope, [&](store::TicketContent& content) {
            putValues(content, options, values, position);
        })) {
        noSuchTicket(name);
    }
}

void remove(const Invocation& invocation, const KeyOptions& options) {
    const TicketName name = ticketNamed(options.ticket);
    const int position = options.at();
    store::Scope scope;
    scope.keys.emplace(options.key, true);
    SETMULTIPAR table[2];
    table[0].key = options.key.c_str();
    table[0].position = position;
    bool found = false;
    if (!invocation.open()->change(name.type, name.id, scope, [&](store::TicketContent& content) {
            found = content.find(options.key) != nullptr;
            content.apply(table);
        })) {
        noSuchTicket(name);
    }
    if (!found || !table[0].ok()) {
        throw Failure(Status::NotThere, textOf(name) + " has no key " + printable(options.key) +
                                            (found ? " of so many elements" : ""));
    }
}

} // namespace

void addKeyCommands(Command program, Invocation& invocation) {
    auto group = program.group("key", "Keys of a ticket: read, set, delete");
    const auto options = std::make_shared<KeyOptions>();
    const auto command = [&](const char* word, const char* text, auto run) -> Command {
        auto added = addCommand<KeyOptions>(
            group, invocation, word, text, options,
            [&invocation, run](const KeyOptions& given) { run(invocation, given); });
        added.option("ticket", options->ticket, "Ticket, such as job/7").required();
        return added;
    };
    const auto withPosition = [&](Command added) {
        added.option("key", options->key, "Key, such as Input/Title").required();
        added.option("--position", options->position, "Only this element, from 0");
    };

    command("list", "List keys", list).option("prefix", options->key, "Only keys with this prefix");

    auto getting = command("get", "Print the values of a key, one element per line", get);
    withPosition(getting);
    getting.flag("--raw", options->raw, "Only the bytes of one element");
    getting.footer(
        "Binaries are printed as base64. --json includes types and holes. On a terminal, "
        "control characters\nare printed as \\xNN.");

    auto setting = command("set", "Set a key", set);
    withPosition(setting);
    setting
        .option("type", options->type,
                "int, uint, int64, uint64, double, string, binary (base64) or pointer")
        .required();
    setting.option("values", options->values, "One value, or several for a vector");
    setting.option("--from", options->from,
                   "The value is the content of this file; - for standard input");
    setting.flag("--append", options->append, "Append to the existing values")
        .excludes("--position");
    setting.footer("Without --position and --append, the values replace the whole key.\n"
                   "Doubles may be NaN, Infinity and -Infinity. Write texts that start with a dash "
                   "after --.\n"
                   "Example: tintgate-store key set job/7 Workflow/Verify/Active int 1");

    auto deleting = command("delete", "Delete a key, or one element of it", remove);
    withPosition(deleting);
    deleting.footer("Elements after a deleted one move up.");
}

} // namespace admin
