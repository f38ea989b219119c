// SPDX-License-Identifier: Apache-2.0
#include <iostream>

#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/CopyStore.h"
#include "companions/tintgate-store/Credentials.h"

namespace admin {

namespace {

struct CopyOptions {
    std::string from;
    std::string to;
};

void copy(const CopyOptions& options) {
    const auto from = store::openStore(completeAddress(options.from), store::Access::Read);
    const std::string target = completeAddress(options.to);
    refuseColon(target, "the new store's address");
    const auto to = store::openCopy(target);
    std::cout << "Copied " << copyStore(*from, *to) << '\n';
}

} // namespace

void addCopyCommand(Command program, Invocation& invocation) {
    const auto options = std::make_shared<CopyOptions>();
    auto command = addCommand<CopyOptions>(program, invocation, "copy",
                                           "Copy a whole store to a new one", options, copy);
    command.option("from", options->from, "Store to copy: folder or connection service").required();
    command
        .option("to", options->to,
                "Place of the new store: an empty or missing folder, or a connection service "
                "whose\ndatabase contains no store")
        .required();
    command.footer("Copies everything unchanged: tickets, users, and files with their versions, "
                   "times and numbers. Nobody\ncan log in to the new store until it is complete; "
                   "repeat an interrupted copy. Nobody should\nwork on the old store "
                   "meanwhile.");
}

} // namespace admin
