// SPDX-License-Identifier: Apache-2.0
#include <iostream>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/Rows.h"

namespace admin {

namespace {

struct GrantOptions {
    std::string role;
    bool client = false;
    bool reports = false;
};

void grant(const Invocation& invocation, const GrantOptions& options) {
    if (options.client == options.reports) {
        throw Failure(Status::BadCommand, "say --client or --reports");
    }
    store::grantRights(invocation.givenAddress(), options.role,
                       options.client ? store::Rights::Client : store::Rights::Reports);
    const char* const rights = options.client ? "client" : "reports";
    if (invocation.json) {
        showObject({{"role", textOrBytes(options.role)}, {"rights", rights}}, true);
        return;
    }
    std::cout << printable(options.role) << " has the rights of " << rights << '\n';
}

} // namespace

void addGrantCommand(Command program, Invocation& invocation) {
    const auto options = std::make_shared<GrantOptions>();
    auto command = addCommand<GrantOptions>(
        program, invocation, "grant", "Give a role of the server what it needs, and no more",
        options, [&](const GrantOptions& given) { grant(invocation, given); });
    command.option("role", options->role, "The role, which the server has already").required();
    command.flag("--client", options->client,
                 "The rights of machines that run jobs: tickets, files, and to log users in");
    command.flag("--reports", options->reports, "The rights to read jobs and files, for trends");
    command.footer("For a store on a PostgreSQL server, by the role that made it. Rights that the "
                   "role had on the store and\ndoes not need are taken from it. After an upgrade "
                   "of the store, grant again.");
}

} // namespace admin
