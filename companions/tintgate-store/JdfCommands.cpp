// SPDX-License-Identifier: Apache-2.0
#include <iostream>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/JdfText.h"
#include "companions/tintgate-store/JobJdf.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/TicketName.h"

namespace admin {

namespace {

struct JdfOptions {
    std::string job;
    std::string updates;
    std::string from; ///< Empty: all versions, if they are of the same delivery.
};

/// The given number, or else the store's number for deliveries, or else the default.
int updatesOf(store::StoreEngine& store, const JdfOptions& options) {
    if (!options.updates.empty()) {
        return wholeNumber(options.updates, 1, std::numeric_limits<int>::max(),
                           "number of updates");
    }
    const int set = updatesAtDelivery(store);
    return set > 0 ? set : usualUpdates;
}

std::string joined(const std::vector<std::string>& texts) {
    std::string all;
    for (const auto& text : texts) {
        all += (all.empty() ? "" : "; ") + text;
    }
    return all;
}

void ready(const Invocation& invocation, const JdfOptions& options) {
    const int job = jobNumber(options.job);
    const auto store = invocation.open();
    const int updates = updatesOf(*store, options);
    std::vector<Row> rows;
    for (const auto& path : jdfPathsOf(*store, job)) {
        const auto changes = readyJdf(*store, path, updates);
        rows.push_back({{"path", textOrBytes(path)}, {"updates", updates}, {"changes", changes}});
        if (!invocation.json) {
            std::cout << printable(path) << ": "
                      << (changes.empty() ? "was ready" : joined(changes)) << '\n';
        }
    }
    if (invocation.json) {
        showRows({}, rows, true);
    }
}

void rebuild(const Invocation& invocation, const JdfOptions& options) {
    const int job = jobNumber(options.job);
    const int from = options.from.empty()
                         ? 0
                         : wholeNumber(options.from, 1, std::numeric_limits<int>::max(), "version");
    const auto store = invocation.open();
    const int updates = updatesOf(*store, options);
    std::vector<Row> rows;
    for (const auto& path : jdfPathsOf(*store, job)) {
        const Rebuilt result = rebuildJdf(*store, path, from, updates);
        rows.push_back({{"path", textOrBytes(path)},
                        {"base", result.base > 0 ? Row(result.base) : Row("now")},
                        {"measurements", result.measurements},
                        {"changed", result.changed}});
    }
    showRows({{"path", "PATH"},
              {"base", "FROM VERSION"},
              {"measurements", "MEASUREMENTS"},
              {"changed", "CHANGED"}},
             rows, invocation.json);
}

} // namespace

void addJdfCommands(Command program, Invocation& invocation) {
    auto group = program.group("jdf", "Keep the JDF of a job intact during its updates");
    group.footer("The update of a JDF may cut its end off; docs/jdf.md explains when. The integer "
                 "System/Jdf/Updates of\nthe system ticket is the number of updates for which "
                 "\"file put\" prepares each JDF:\n"
                 "  tintgate-store key set system System/Jdf/Updates int 8");
    const auto options = std::make_shared<JdfOptions>();
    const auto command = [&](const char* word, const char* text, auto run) -> Command {
        auto added = addCommand<JdfOptions>(
            group, invocation, word, text, options,
            [&invocation, run](const JdfOptions& given) { run(invocation, given); });
        added.option("job", options->job, "Number of the job").required();
        added.option("--updates", options->updates,
                     "Number of updates, 1 to 16; default: the store's number, or 8");
        return added;
    };
    command("ready", "Prepare the JDF so that updates lose nothing", ready)
        .footer("Empties the print dates, ensures the element for measurements, and adds blanks "
                "at the end\nfor the updates to lose. The old file is kept as a "
                "version.");
    auto rebuilding = command(
        "rebuild", "Put the measurements of all versions into the oldest intact one", rebuild);
    rebuilding.option("--from", options->from, "Ignore versions below this one");
    rebuilding.footer(
        "For a JDF damaged by updates. The result is prepared for updates, and the file "
        "that it replaces is\nkept as a version. If several JDFs were delivered under one "
        "name, --from is the number of the first\nversion of the valid one.");
}

} // namespace admin
