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
#include "companions/tintgate-store/LocalFile.h"
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

/// Creates the store's folder for a group. Whatever a store creates in it inherits its permissions.
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

/// Throws Failure (Damaged) if there is a fault, after all are shown.
void verify(const Invocation& invocation) {
    const auto store = invocation.open();
    std::vector<Row> faults;
    const auto found = store->verify([&](const std::string& where, const std::string& what) {
        faults.push_back({{"where", textOrBytes(where)}, {"what", textOrBytes(what)}});
    });
    if (invocation.json) {
        showObject({{"tickets", found.tickets},
                    {"files", found.files},
                    {"versions", found.versions},
                    {"bytes", found.bytes},
                    {"faults", faults}},
                   true);
    } else {
        if (!faults.empty()) {
            showRows({{"where", "WHERE"}, {"what", "FAULT"}}, faults, false);
        }
        std::cout << "Read " << counted(found.tickets, "ticket") << ", "
                  << counted(found.files, "file") << " and " << counted(found.versions, "version")
                  << ": " << (faults.empty() ? "no fault" : counted(std::ssize(faults), "fault"))
                  << '\n';
    }
    if (!faults.empty()) {
        finishStandardOutput();
        throw Failure(Status::Damaged,
                      "the store is damaged: " + counted(std::ssize(faults), "fault") + " found");
    }
}

} // namespace

void addStoreCommands(Command program, Invocation& invocation) {
    const auto options = std::make_shared<MakeOptions>();
    auto command =
        addCommand<MakeOptions>(program, invocation, "make", "Make a new store", options,
                                [&](const MakeOptions& given) { make(invocation, given); });
    command.option("--name", options->serverName, "Name of the server").showDefault();
    command.option(
        "--group", options->group,
        "Group whose members can use the store, whatever their umasks; only for a folder");
    command.footer(
        "The folder must not be there yet, or be empty; a server's database must hold no store. "
        "The\n"
        "address must have no \":\", since a job's arguments keep only what follows the last one.");

    addCommand<NoOptions>(
        program, invocation, "upgrade", "Bring a store of an older format up to date",
        std::make_shared<NoOptions>(), [&](const NoOptions&) { upgrade(invocation); })
        .footer("Back the store up first; there is no way back.");
    addCommand<NoOptions>(
        program, invocation, "verify", "Read all of the store and say whether it is whole",
        std::make_shared<NoOptions>(), [&](const NoOptions&) { verify(invocation); })
        .footer("Changes nothing, and others may be at work. Reads the database and all files, "
                "looks whether each key\ncan be decoded, each file and version has its content "
                "and each content its file, and no version is\nmissing. A backup that passes is "
                "a whole one. Status 10 if there is a fault.");
    addCommand<NoOptions>(program, invocation, "info", "Show what is in the store",
                          std::make_shared<NoOptions>(),
                          [&](const NoOptions&) { info(invocation); });
}

} // namespace admin
