// SPDX-License-Identifier: Apache-2.0
#include <iostream>

#include "base/Utf8.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Credentials.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/Rows.h"
#include "store/Users.h"

namespace admin {

namespace {

struct UserOptions {
    std::string name;
    std::string passwordFile;
};

store::User userNamed(store::StoreEngine& store, const std::string& typed) {
    auto user = store.user(userName(typed));
    if (!user) {
        throw Failure(Status::NotThere, "there is no user " + typed);
    }
    return *user;
}

void refuseKnown(store::StoreEngine& store, const UserOptions& options) {
    if (store.user(userName(options.name))) {
        throw Failure(Status::Exists, "there is a user " + options.name);
    }
}

void add(const Invocation& invocation, const UserOptions& options) {
    const std::string name = newUserName(options.name);
    const auto store = invocation.open();
    refuseKnown(*store, options);
    const std::string hash = store::passwordHash(askPassword(options.passwordFile, options.name));
    // While one person types a password, another one may add the user.
    if (!store->addUser({name, hash, false})) {
        refuseKnown(*store, options);
        throw Failure(Status::Exists, "there is a user " + options.name);
    }
}

void changePassword(const Invocation& invocation, const UserOptions& options) {
    const auto store = invocation.open();
    userNamed(*store, options.name);
    const std::string hash = store::passwordHash(askPassword(options.passwordFile, options.name));
    // Read again, for the same reason.
    store::User user = userNamed(*store, options.name);
    user.passwordHash = hash;
    store->putUser(user);
}

void setDisabled(const Invocation& invocation, const UserOptions& options, bool disabled) {
    const auto store = invocation.open();
    store::User user = userNamed(*store, options.name);
    user.disabled = disabled;
    store->putUser(user);
}

void remove(const Invocation& invocation, const UserOptions& options) {
    const auto store = invocation.open();
    if (!store->removeUser(userNamed(*store, options.name).name)) {
        throw Failure(Status::NotThere, "there is no user " + options.name);
    }
}

void list(const Invocation& invocation) {
    std::vector<Row> rows;
    for (const auto& user : invocation.open()->users()) {
        rows.push_back({{"name", base::utf8FromLatin1(user.name)},
                        {"state", user.disabled ? "disabled" : "enabled"}});
    }
    showRows({{"name", "NAME"}, {"state", "STATE"}}, rows, invocation.json);
}

} // namespace

void addUserCommands(Command program, Invocation& invocation) {
    auto group = program.group("user", "Users; each can log in and see the whole store");
    const auto options = std::make_shared<UserOptions>();
    const auto command = [&](const char* word, const char* text, auto run) -> Command {
        auto added = addCommand<UserOptions>(
            group, invocation, word, text, options,
            [&invocation, run](const UserOptions& given) { run(invocation, given); });
        added.option("name", options->name, "The user's name").required();
        return added;
    };
    const auto withPassword = [&](Command added) {
        added.option("--password-file", options->passwordFile,
                     "File whose first line is the password; - for standard input");
        added.footer("Without --password-file, the program asks for the password, without echo. It "
                     "is never on the\ncommand line, where everybody could see it.");
    };
    withPassword(command("add", "Add a user", add));
    withPassword(command("password", "Set a user's password", changePassword));
    command("disable", "Prevent a user from logging in",
            [](const auto& invoked, const auto& given) { setDisabled(invoked, given, true); });
    command("enable", "Let a user log in again",
            [](const auto& invoked, const auto& given) { setDisabled(invoked, given, false); });
    command("remove", "Remove a user", remove);
    addCommand<UserOptions>(group, invocation, "list", "List users", options,
                            [&](const UserOptions&) { list(invocation); });
    group.footer(
        "Names and passwords have 1 to 127 characters, none above U+00FF and no \":\": a login "
        "brings one byte\nfor each, and a job's arguments keep only what follows the last "
        "\":\".");
}

} // namespace admin
