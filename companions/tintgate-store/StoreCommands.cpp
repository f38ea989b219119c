#include <iostream>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Credentials.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/KeyValue.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/TicketName.h"

namespace admin {

namespace {

struct MakeOptions {
    std::string serverName = "Tintgate";
};

struct NoOptions {};

void make(const Invocation& invocation, const MakeOptions& options) {
    if (options.serverName.empty() || !isUtf8(options.serverName)) {
        throw Failure(Status::BadInput, "the server's name is empty or no UTF-8");
    }
    refuseColon(invocation.givenAddress(), "the store's address");
    store::makeStore(invocation.givenAddress(), options.serverName);
    std::cout << "Made the store " << printable(invocation.givenAddress()) << '\n';
}

void upgrade(const Invocation& invocation) {
    const bool older = store::bringStoreUpToDate(invocation.givenAddress());
    std::cout << (older ? "The store is now up to date\n" : "The store was up to date\n");
}

std::size_t ticketCount(store::StoreEngine& store) {
    std::size_t count = 0;
    for (int type = 0; TICKET_TYPE_Valid(type); ++type) {
        count += store.ids(type).size();
    }
    return count;
}

void info(const Invocation& invocation) {
    const auto store = invocation.open();
    const auto name = textOf(store->key(0, 0, "System/ServerName"));
    showObject(Row{{"store", textOrBytes(invocation.givenAddress())},
                   {"server", name ? textOrBytes(*name) : Json()},
                   {"jobs", store->ids(jobType).size()},
                   {"presets", store->ids(presetType).size()},
                   {"tickets", ticketCount(*store)},
                   {"users", store->users().size()},
                   {"files", store->files().size()}},
               invocation.json);
}

} // namespace

void addStoreCommands(Command program, Invocation& invocation) {
    const auto options = std::make_shared<MakeOptions>();
    auto command =
        addCommand<MakeOptions>(program, invocation, "make", "Make a new store", options,
                                [&](const MakeOptions& given) { make(invocation, given); });
    command.option("--name", options->serverName, "Name that the server gives itself")
        .showDefault();
    command.footer(
        "The folder must not be there yet, or be empty; a server's database must hold no store. "
        "The\n"
        "address must have no \":\", since a job's arguments keep only what follows the last one.");

    addCommand<NoOptions>(
        program, invocation, "upgrade", "Bring a store of an older format up to date",
        std::make_shared<NoOptions>(), [&](const NoOptions&) { upgrade(invocation); })
        .footer("Back the store up first; there is no way back.");
    addCommand<NoOptions>(program, invocation, "info", "Show what is in the store",
                          std::make_shared<NoOptions>(),
                          [&](const NoOptions&) { info(invocation); });
}

} // namespace admin
