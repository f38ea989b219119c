// SPDX-License-Identifier: Apache-2.0
// default = "coated-proof"
// [conditions.coated-proof]
// target = "/srv/references/FOGRA51.txt"   or "FOGRA51.txt", a data set that is looked up
// preset = "contract-proof"                may be absent; a short name, a number or a path
// patch-set = "wedge.txt"                  may be absent, as the next two
// paper = "Proof paper 235"
// printer = "Proofer 2"
#include "companions/tintgate-check/Conditions.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <iterator>

#include <toml++/toml.h>

#include "ExitCodes.h"
#include "colour/ColourFile.h"
#include "companions/tintgate-check/Problem.h"
#include "companions/tintgate-check/Words.h"

namespace check {
namespace {

namespace fs = std::filesystem;

constexpr std::size_t mostBytes = std::size_t{1} << 20;

struct Key {
    const char* name;
    std::string Condition::*member;
};
constexpr Key keys[] = {{"target", &Condition::target},
                        {"preset", &Condition::preset},
                        {"patch-set", &Condition::patchSet},
                        {"paper", &Condition::paper},
                        {"printer", &Condition::printer}};

[[noreturn]] void fail(std::string what, std::string remedy) {
    throw Failure(Status::NotDone, {0, std::move(what), {}, std::move(remedy)});
}

/// "conditions.toml, line 3"
std::string place(const std::string& path, const toml::source_region& source) {
    return path + ":" + std::to_string(source.begin.line);
}

std::string textOf(const std::string& path, const toml::key& key, const toml::node& node) {
    if (const auto text = node.value_exact<std::string>()) {
        return *text;
    }
    if (const auto number = node.value_exact<std::int64_t>(); number && key.str() == "preset") {
        return std::to_string(*number);
    }
    fail(say(Say::NotText, {place(path, node.source()), key.str()}),
         say(Say::NotTextRemedy, {key.str()}));
}

[[noreturn]] void failUnknown(const std::string& path, const toml::key& key,
                              const std::string& known) {
    fail(say(Say::UnknownKey, {place(path, key.source()), key.str()}),
         say(Say::UnknownKeyRemedy, {known}));
}

Condition conditionOf(const std::string& path, const toml::key& name, const toml::node& node) {
    const toml::table* const table = node.as_table();
    if (table == nullptr) {
        failUnknown(path, name, "[conditions.NAME]");
    }
    Condition condition;
    condition.name = name.str();
    for (const auto& [key, value] : *table) {
        const auto known = std::find_if(std::begin(keys), std::end(keys),
                                        [&](const Key& k) { return key.str() == k.name; });
        if (known == std::end(keys)) {
            failUnknown(path, key, "target, preset, patch-set, paper, printer");
        }
        condition.*known->member = textOf(path, key, value);
    }
    if (condition.target.empty()) {
        fail(say(Say::NoTarget, {place(path, name.source()), condition.name}),
             say(Say::NoTargetRemedy));
    }
    return condition;
}

Conditions conditionsOf(const std::string& path, const toml::table& document) {
    Conditions conditions;
    conditions.file = path;
    std::string defaultPlace;
    for (const auto& [key, node] : document) {
        const toml::table* const table = node.as_table();
        if (key.str() == "default") {
            conditions.defaultName = textOf(path, key, node);
            defaultPlace = place(path, node.source());
        } else if (key.str() == "conditions" && table != nullptr) {
            for (const auto& [name, condition] : *table) {
                conditions.all.push_back(conditionOf(path, name, condition));
            }
        } else {
            failUnknown(path, key, "default, [conditions.NAME]");
        }
    }
    if (!conditions.defaultName.empty() && !conditions.find(conditions.defaultName)) {
        fail(say(Say::DefaultUnknown, {defaultPlace, conditions.defaultName}), say(Say::SeeList));
    }
    return conditions;
}

} // namespace

const Condition* Conditions::find(std::string_view name) const {
    const auto found =
        std::find_if(all.begin(), all.end(), [&](const Condition& c) { return c.name == name; });
    return found == all.end() ? nullptr : &*found;
}

std::string userFolder() {
    const char* const settings = std::getenv("XDG_CONFIG_HOME");
    const char* const home = std::getenv("HOME");
    if (settings != nullptr && *settings == '/') {
        return std::string(settings) + "/tintgate";
    }
    return home != nullptr && *home != '\0' ? std::string(home) + "/.config/tintgate" : "";
}

std::string systemFolder() {
    const char* const root = std::getenv("TINTGATE_ROOT");
    return std::string(root != nullptr ? root : "") + "/etc/tintgate";
}

Conditions readConditions(const std::string& path) {
    std::string bytes;
    switch (colour::readWholeFile(path, mostBytes, bytes)) {
    case colour::Failure::None:
        break;
    case colour::Failure::Missing:
        fail(say(Say::ConditionsMissing, {path}), say(Say::ConditionsMissingRemedy));
    default: {
        Problem problem = problemOfFile(exitInputUnreadable, path);
        problem.what = say(Say::ConditionsBroken, {path, problem.what});
        throw Failure(Status::NotDone, std::move(problem));
    }
    }
    try {
        return conditionsOf(path, toml::parse(bytes, path));
    } catch (const toml::parse_error& error) {
        fail(say(Say::ConditionsBroken, {place(path, error.source()), error.description()}),
             say(Say::ConditionsBrokenRemedy));
    }
}

Conditions findConditions() {
    for (const std::string& folder : {userFolder(), systemFolder()}) {
        std::error_code ignored;
        const std::string path = folder + "/conditions.toml";
        if (!folder.empty() && fs::exists(fs::symlink_status(path, ignored))) {
            return readConditions(path);
        }
    }
    return {};
}

std::string pathFrom(const Conditions& conditions, const std::string& path) {
    const char* const home = std::getenv("HOME");
    if (path.starts_with("~/") && home != nullptr) {
        return home + path.substr(1);
    }
    const std::size_t slash = conditions.file.rfind('/');
    if (path.find('/') == path.npos || path.starts_with('/') || slash == path.npos) {
        return path;
    }
    return conditions.file.substr(0, slash + 1) + path;
}

} // namespace check
