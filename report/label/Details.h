// SPDX-License-Identifier: Apache-2.0
// What a label states of a print besides its colours.
#pragma once

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace label {

/// In the order in which they are printed.
enum class Field {
    Condition, ///< The printing condition that the print simulates.
    Preset,
    Date,
    Printer,
    Paper,
    Instrument, ///< With the measurement condition.
    Operator,
    Software,   ///< The proofing software.
    Colourants, ///< The inks or toners of the printer.
    Profile,    ///< The profile of the simulated printing condition, or the target's file.
    Intent,     ///< The rendering intent.
    Calibrated, ///< When the printer was calibrated.
    Job,
    Workflow,
    NotStated, ///< The names of those that a proof must state and that are not known.
};
inline constexpr std::size_t fieldCount = 15;

/// Texts that replace what result and job state, or add what these don't. Fields that are made of
/// the result alone (Preset, Date, Job, NotStated) are ignored.
using Details = std::map<Field, std::string>;

/// The field of a name on a command line or in a settings file: "condition", "printer", "paper",
/// "instrument", "operator", "software", "colourants", "profile", "intent", "calibrated" or
/// "workflow". Nothing for any other.
std::optional<Field> fieldOf(std::string_view name);

/// These names, for a message: "calibrated, colourants, ...".
std::string fieldNames();

/// What a date is the date of.
enum class DateKind {
    Verified, ///< The comparison.
    Measured, ///< The measurement, as its file states it.
    Filed,    ///< The result's file: its own time.
};

} // namespace label
