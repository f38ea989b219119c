// SPDX-License-Identifier: Apache-2.0
// conditions.toml: names for what a print is held against.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace check {

struct Condition {
    std::string name;
    std::string target;   ///< As written: a path, or the bare name of a data set.
    std::string preset;   ///< As written: short name, number or path; may be empty.
    std::string patchSet; ///< As written, as `target`; may be empty.
    std::string paper;    ///< Texts for pages; may be empty.
    std::string printer;
};

struct Conditions {
    std::string file; ///< Where they are from; empty if there is no such file.
    std::string defaultName;
    std::vector<Condition> all; ///< In the order of their names.

    const Condition* find(std::string_view name) const; ///< Null if there is none.
};

/// The user's folder of settings, ~/.config/tintgate as a rule; empty without a home.
std::string userFolder();

/// /etc/tintgate, below TINTGATE_ROOT if that is set.
std::string systemFolder();

/// Reads a file of conditions. Throws Failure (NotDone) that names the line of the first fault. A
/// key that is not known is one: it is most likely a slip in something that was meant to count.
Conditions readConditions(const std::string& path);

/// Those of the user, otherwise those of the system, otherwise none.
Conditions findConditions();

/// A relative path in a file of conditions is relative to the folder of that file; "~/" is the
/// user's home. A bare name stays as it is.
std::string pathFrom(const Conditions& conditions, const std::string& path);

} // namespace check
