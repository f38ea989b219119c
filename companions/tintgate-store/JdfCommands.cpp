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
    std::string from; ///< Empty: all versions, if they are of one delivery.
};

/// As given, else as the store has it for deliveries, else the usual number.
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
    auto group = program.group("jdf", "Keep the JDF of a job whole through its updates");
    group.footer("The update of a JDF may cut its end off; docs/jdf.md tells when. The integer "
                 "System/Jdf/Updates of the\nsystem ticket has each JDF made ready for so many "
                 "updates when \"file put\" delivers it:\n"
                 "  tintgate-store key set system System/Jdf/Updates int 8");
    const auto options = std::make_shared<JdfOptions>();
    const auto command = [&](const char* word, const char* text, auto run) -> Command {
        auto added = addCommand<JdfOptions>(
            group, invocation, word, text, options,
            [&invocation, run](const JdfOptions& given) { run(invocation, given); });
        added.option("job", options->job, "Number of the job").required();
        added.option("--updates", options->updates,
                     "For how many, 1 to 16; else as the store says, else 8");
        return added;
    };
    command("ready", "Prepare the JDF so that updates lose nothing of it", ready)
        .footer("Empties the print dates, sees to the element that holds measurements, and puts "
                "blanks behind the end\nfor the updates to lose. What the file was is kept as a "
                "version.");
    auto rebuilding = command(
        "rebuild", "Put the measurements of all versions into the oldest sound one", rebuild);
    rebuilding.option("--from", options->from, "Leave out versions below this one");
    rebuilding.footer("For a JDF that updates have damaged. The result is made ready, and what it "
                      "replaces is kept as a\nversion. If several JDFs were delivered under one "
                      "name, --from is the number of the first version of\nthe one that counts.");
}

} // namespace admin
