// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <ctime>

#include "base/Utf8.h"
#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Credentials.h"
#include "companions/tintgate-store/Days.h"
#include "companions/tintgate-store/Rows.h"

namespace admin {

namespace {

struct LogOptions {
    std::string since;
};

void show(const Invocation& invocation, const LogOptions& options) {
    const std::int64_t since =
        options.since.empty() ? 0 : timeBefore(daysOf(options.since, "--since"));
    std::vector<Row> rows;
    for (const auto& entry : invocation.open()->logEntries()) {
        if (entry.time >= since) {
            rows.push_back(
                {{"time", entry.time},
                 {"at", shownTime(entry.time)},
                 {"event", std::string(store::eventName(entry.event))},
                 {"user", entry.who.empty() ? Row() : Row(base::utf8FromLatin1(entry.who))},
                 {"origin", textOrBytes(entry.origin)},
                 {"what", textOrBytes(entry.what)}});
        }
    }
    showRows({{"at", "TIME"},
              {"event", "EVENT"},
              {"user", "USER"},
              {"origin", "FROM"},
              {"what", "WHAT"}},
             rows, invocation.json);
}

} // namespace

void addLogCommand(Command program, Invocation& invocation) {
    const auto options = std::make_shared<LogOptions>();
    auto command =
        addCommand<LogOptions>(program, invocation, "log", "Show who did what in the store",
                               options, [&](const LogOptions& given) { show(invocation, given); });
    command.option("--since", options->since, "Of the last days only, such as 7d");
    command.footer(
        "Logins, refused logins, writes that the store did not take, and what this program "
        "changed. "
        "FROM is the\nnumber of the account, and the machine. A refused name that is no user's is "
        "not kept. Best effort: a\nstore that can't be written has no log, and only the last "
        "10,000 events or so are there.");
}

} // namespace admin
