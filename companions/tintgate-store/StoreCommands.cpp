// SPDX-License-Identifier: Apache-2.0
#include <cerrno>
#include <cstring>
#include <iostream>

#include <grp.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/Utf8.h"
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
    std::string group;
};

struct NoOptions {};

gid_t numberOfGroup(const std::string& name) {
    const group* const known = getgrnam(name.c_str());
    if (known == nullptr) {
        throw Failure(Status::BadInput, "there is no group " + printable(name));
    }
    return known->gr_gid;
}

/// Makes the store's folder for a group. All that a store makes in it follows its permissions.
void makeFolder(const std::string& folder, const std::string& group) {
    if (folder[0] != '/') {
        throw Failure(Status::BadCommand, "--group is for a store in a folder");
    }
    const gid_t number = numberOfGroup(group);
    if (mkdir(folder.c_str(), 0700) != 0) {
        throw Failure(errno == EEXIST ? Status::Exists : Status::ReadOnly,
                      printable(folder) + " can't be made: " + std::strerror(errno));
    }
    if (chown(folder.c_str(), static_cast<uid_t>(-1), number) != 0 ||
        chmod(folder.c_str(), 02770) != 0) {
        const std::string reason = std::strerror(errno);
        rmdir(folder.c_str());
        throw Failure(Status::ReadOnly, printable(folder) + " can't be given to the group " +
                                            printable(group) + ": " + reason);
    }
}

void make(const Invocation& invocation, const MakeOptions& options) {
    if (options.serverName.empty() || !base::isUtf8(options.serverName)) {
        throw Failure(Status::BadInput, "the server's name is empty or no UTF-8");
    }
    refuseColon(invocation.givenAddress(), "the store's address");
    if (!options.group.empty()) {
        makeFolder(invocation.givenAddress(), options.group);
    }
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
    command.option(
        "--group", options->group,
        "Group whose members can all use the store, whatever their umasks; for a folder");
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
