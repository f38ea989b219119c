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
                "Where the new one is to be: a folder that is empty or not there, or a "
                "connection service whose\ndatabase holds no store")
        .required();
    command.footer("Everything is copied as it is: tickets, users, and files with their versions, "
                   "times and numbers. Nobody\ncan log in to the new store before it is complete; "
                   "a copy that was broken off is run again. Nobody\nshould work on the old store "
                   "meanwhile.");
}

} // namespace admin
