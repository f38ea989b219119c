// SPDX-License-Identifier: Apache-2.0
#include <iostream>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/LocalFile.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/TicketName.h"
#include "companions/tintgate-store/TicketsFile.h"

namespace admin {

namespace {

[[noreturn]] void noSuchTicket(const TicketName& name) {
    throw Failure(Status::NotThere, "there is no ticket " + textOf(name));
}

struct TypeOption {
    std::string type;

    std::vector<int> types() const {
        if (!type.empty()) {
            return {typeNamed(type)};
        }
        std::vector<int> all;
        for (int each = 0; TICKET_TYPE_Valid(each); ++each) {
            all.push_back(each);
        }
        return all;
    }
};

void list(const Invocation& invocation, const TypeOption& options) {
    const auto store = invocation.open();
    std::vector<Row> rows;
    for (const int type : options.types()) {
        for (const int id : store->ids(type)) {
            rows.push_back({{"ticket", textOf({type, id})}, {"type", type}, {"id", id}});
        }
    }
    showRows({{"ticket", "TICKET"}, {"type", "TYPE"}, {"id", "ID"}}, rows, invocation.json);
}

struct TicketOption {
    std::string ticket;
};

void create(const Invocation& invocation, const TicketOption& options) {
    const auto store = invocation.open();
    if (options.ticket.find('/') != std::string::npos || options.ticket == "system") {
        const TicketName name = ticketNamed(options.ticket);
        if (!store->create(name.type, name.id)) {
            throw Failure(Status::Exists, "there is a ticket " + textOf(name));
        }
        std::cout << textOf(name) << '\n';
        return;
    }
    const int type = typeNamed(options.ticket);
    const int id = store->createNext(type);
    if (id < 0) {
        throw Failure(Status::Full, "all ids of this type are taken");
    }
    std::cout << textOf({type, id}) << '\n';
}

void remove(const Invocation& invocation, const TicketOption& options) {
    const TicketName name = ticketNamed(options.ticket);
    if (!invocation.open()->remove(name.type, name.id)) {
        noSuchTicket(name);
    }
}

struct ImportOptions {
    std::vector<std::string> files;
    bool merge = false;
};

/// Imports one ticket in one transaction, so that nobody sees it without its keys.
void import(store::StoreEngine& store, const NamedTicket& ticket, bool merge) {
    const auto& [name, content] = ticket;
    store::Scope scope;
    scope.make = true;
    scope.everything = !merge;
    if (merge) {
        for (const auto& [key, elements] : content.keys()) {
            scope.keys.emplace(key, false);
        }
    }
    store.change(name.type, name.id, scope, [&, &content = content](store::TicketContent& stored) {
        stored.transfer(content, !merge);
    });
}

void importAll(const Invocation& invocation, const ImportOptions& options) {
    // Reads and checks all before writing the first.
    std::vector<NamedTicket> tickets;
    for (const auto& path : options.files) {
        LocalInput input(path);
        try {
            auto read = readTickets(input.stream());
            std::move(read.begin(), read.end(), std::back_inserter(tickets));
        } catch (const Failure& failure) {
            throw Failure(failure.status, printable(path) + ": " + failure.what());
        }
    }
    const auto store = invocation.open();
    std::size_t count = 0;
    {
        Progress progress(tickets.size(), "tickets");
        for (const auto& ticket : tickets) {
            try {
                import(*store, ticket, options.merge);
            } catch (const store::StoreFailure& failure) {
                throw Failure(statusOf(failure.status),
                              std::string(failure.what()) + " (at " + textOf(ticket.name) + "; " +
                                  std::to_string(count) + " of " + std::to_string(tickets.size()) +
                                  " tickets are in)");
            }
            progress.done(++count);
        }
    }
    std::cout << "Imported " << counted(count, "ticket") << '\n';
}

struct ExportOptions {
    std::vector<std::string> tickets;
    TypeOption type;
    std::string output = "-";
};

std::vector<TicketName> chosen(store::StoreEngine& store, const ExportOptions& options) {
    std::vector<TicketName> names;
    for (const auto& text : options.tickets) {
        names.push_back(ticketNamed(text));
        if (!store.exists(names.back().type, names.back().id)) {
            noSuchTicket(names.back());
        }
    }
    if (!options.tickets.empty()) {
        return names;
    }
    for (const int type : options.type.types()) {
        for (const int id : store.ids(type)) {
            names.push_back({type, id});
        }
    }
    return names;
}

void exportAll(const Invocation& invocation, const ExportOptions& options) {
    const auto store = invocation.open();
    const auto names = chosen(*store, options);
    writeLocalFile(options.output, [&](std::ostream& to) {
        TicketsWriter writer(to);
        Progress progress(names.size(), "tickets");
        std::size_t count = 0;
        for (const auto& name : names) {
            // Skips tickets deleted since the list was made.
            if (const auto content = store->content(name.type, name.id, store::KeyFilter())) {
                writer.add(name, *content);
            }
            progress.done(++count);
        }
        writer.finish();
    });
}

void addTicketGroup(Command program, Invocation& invocation) {
    auto group = program.group("ticket", "Tickets: jobs, presets and the system's own");
    const auto type = std::make_shared<TypeOption>();
    addCommand<TypeOption>(group, invocation, "list", "List tickets", type,
                           [&](const TypeOption& given) { list(invocation, given); })
        .option("--type", type->type, "Only this type: job, preset, system or 0 to 49");

    const auto ticket = std::make_shared<TicketOption>();
    auto created = addCommand<TicketOption>(
        group, invocation, "create", "Create an empty ticket and print its name", ticket,
        [&](const TicketOption& given) { create(invocation, given); });
    created.option("ticket", ticket->ticket, "Ticket, or only a type for the next free id")
        .required();
    auto removed = addCommand<TicketOption>(
        group, invocation, "delete", "Delete a ticket with all its keys", ticket,
        [&](const TicketOption& given) { remove(invocation, given); });
    removed.option("ticket", ticket->ticket, "Ticket").required();
    group.footer("A ticket is named job/7, preset/1, system, or TYPE/ID such as 12/3.");
}

} // namespace

void addTicketCommands(Command program, Invocation& invocation) {
    addTicketGroup(program, invocation);

    const auto imported = std::make_shared<ImportOptions>();
    auto import = addCommand<ImportOptions>(
        program, invocation, "import", "Import tickets from JSON files", imported,
        [&](const ImportOptions& given) { importAll(invocation, given); });
    import.option("files", imported->files, "JSON files; - for standard input").required();
    import.flag("--merge", imported->merge,
                "Keep keys that are not in the file; default: replace each ticket");
    import.footer("All files are checked completely before anything is written. Each ticket is one "
                  "step, and an\ninterrupted import can be repeated. docs/stores.md describes the "
                  "format.");

    const auto exported = std::make_shared<ExportOptions>();
    auto command = addCommand<ExportOptions>(
        program, invocation, "export", "Write tickets as JSON", exported,
        [&](const ExportOptions& given) { exportAll(invocation, given); });
    command.option("tickets", exported->tickets, "Tickets such as job/7; all if none is named");
    command
        .option("--type", exported->type.type, "All of this type: job, preset, system or 0 to 49")
        .excludes("tickets");
    command.option("-o,--output", exported->output, "File; - for standard output").showDefault();
}

} // namespace admin
