// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <iostream>
#include <iterator>

#include "ExitCodes.h"
#include "companions/diagnosis/Diagnosis.h"
#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Credentials.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/TicketName.h"

namespace admin {

namespace {

struct DiagnoseOptions {
    std::string job;
    std::string strip;
    std::string selector;
    std::string user;
    bool remeasure = false;
    bool all = false;
};

using diagnosis::Diagnosis;
using diagnosis::Finding;

/// "103, The job's tolerance preset could not be loaded".
std::string codeText(int code) {
    const auto found = std::find_if(std::begin(exitCodeTexts), std::end(exitCodeTexts),
                                    [&](const ExitCodeText& text) { return text.code == code; });
    return std::to_string(code) +
           (found == std::end(exitCodeTexts) ? std::string() : std::string(", ") + found->meaning);
}

std::string verdictOf(const Diagnosis& diagnosis) {
    if (diagnosis.code != exitDone) {
        return "A run ends with " + codeText(diagnosis.code) + ".";
    }
    const std::string what = diagnosis.measures
                                 ? "Nothing in the store keeps the job from being measured"
                                 : "The stored measurement is compared, and the run succeeds";
    return what + (diagnosis.spoilers.empty() ? "." : ", but the result is wrong.");
}

void showFindings(const std::string& heading, const std::vector<Finding>& findings) {
    if (findings.empty()) {
        return;
    }
    std::cout << heading << ":\n";
    for (const Finding& finding : findings) {
        std::cout << "  " << printable(finding.where) << "\n      " << printable(finding.text)
                  << '\n';
    }
}

Row findingsJson(const std::vector<Finding>& findings) {
    Row rows = Row::array();
    for (const Finding& finding : findings) {
        rows.push_back({{"where", textOrBytes(finding.where)},
                        {"text", textOrBytes(finding.text)},
                        {"codes", finding.codes}});
    }
    return rows;
}

Row diagnosisJson(int job, const std::string& selector, const Diagnosis& diagnosis, bool all) {
    Row object{{"job", job},
               {"selector", textOrBytes(selector)},
               {"code", diagnosis.code},
               {"measures", diagnosis.measures},
               {"verdict", verdictOf(diagnosis)},
               {"causes", findingsJson(diagnosis.causes)},
               {"spoilers", findingsJson(diagnosis.spoilers)},
               {"notices", findingsJson(diagnosis.notices)},
               {"machine", findingsJson(diagnosis.machine)}};
    if (all) {
        Row rows = Row::array();
        for (const auto& [where, answer] : diagnosis.asked) {
            rows.push_back({{"where", textOrBytes(where)}, {"answer", textOrBytes(answer)}});
        }
        object["asked"] = rows;
    }
    return object;
}

void show(int job, const std::string& selector, const Diagnosis& diagnosis, bool all) {
    std::cout << "Job " << job << ", strip selector " << printable(selector) << ". "
              << verdictOf(diagnosis) << '\n';
    showFindings("Cause", diagnosis.causes);
    showFindings("The result is wrong because of", diagnosis.spoilers);
    showFindings("Also noticed", diagnosis.notices);
    showFindings("On this machine", diagnosis.machine);
    if (all) {
        std::cout << "Read, in this order:\n";
        for (const auto& [where, answer] : diagnosis.asked) {
            std::cout << "  " << printable(where) << ": " << printable(answer) << '\n';
        }
    }
}

void diagnoseJob(const Invocation& invocation, const DiagnoseOptions& options) {
    diagnosis::Request request;
    request.job = jobNumber(options.job);
    if (!options.strip.empty()) {
        request.selector = std::to_string(wholeNumber(options.strip, 1, 2, "strip") - 1);
    } else if (!options.selector.empty()) {
        request.selector = options.selector;
    }
    request.remeasure = options.remeasure;
    if (!options.user.empty()) {
        request.user = options.user;
        request.login = userName(options.user);
    }
    const Diagnosis diagnosis = diagnosis::diagnose(invocation.givenAddress(), request);
    if (invocation.json) {
        showObject(diagnosisJson(request.job, request.selector, diagnosis, options.all), true);
    } else {
        show(request.job, request.selector, diagnosis, options.all);
    }
    if (!diagnosis.isSound()) {
        throw Failure(Status::JobFails, "the job has a fault; see above");
    }
}

} // namespace

void addDiagnoseCommand(Command program, Invocation& invocation) {
    const auto options = std::make_shared<DiagnoseOptions>();
    auto command = addCommand<DiagnoseOptions>(
        program, invocation, "diagnose", "Find out why the run of a job fails", options,
        [&](const DiagnoseOptions& given) { diagnoseJob(invocation, given); });
    command.option("job", options->job, "Number of the job").required();
    command.option("--strip", options->strip, "1 (the default) or 2");
    command
        .option("--selector", options->selector,
                "Strip selector as passed by the client; 0 is the first strip")
        .excludes("--strip");
    command.flag("--remeasure", options->remeasure, "As if the client requested a new measurement");
    command.option("--user", options->user, "Name of the user who logs in");
    command.flag("--all", options->all, "Show every key and file that the run reads");
    command.footer(
        "Runs the tool on the job up to the start of a measurement, without writing to the store "
        "or to the\njob's folder. Names the key, file or setting that makes the run fail or its "
        "result wrong, and the\nexit code of the run.");
}

} // namespace admin
