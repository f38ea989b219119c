// SPDX-License-Identifier: Apache-2.0
// Every word that labels and certificates print, and how they write numbers and dates. The words of
// criteria and warnings are the result's.
#pragma once

#include <cstddef>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>

#include "report/Result.h"
#include "report/label/Details.h"

namespace label {

/// The texts of one language. Names in braces are filled in.
struct Texts {
    const char* passed;
    const char* failed;
    const char* incomplete;

    const char* untitled;
    const char* fields[fieldCount]; ///< In the order of Field.
    const char* dates[3];           ///< In the order of DateKind: in place of the field's own.
    const char* target;             ///< In place of Field::Profile if the target is no profile.
    const char* notStated;          ///< What a certificate prints for a field that it must have.
    const char* job;
    const char* jobOfSheet;
    const char* labelled; ///< A field with its label.

    const char* criteria;
    const char* criterion;
    const char* value;
    const char* tolerance;
    const char* valueOfTolerance;
    const char* headOfValues;
    const char* more;       ///< Criteria that are not listed, by their outcomes:
    const char* countedAll; ///< The same if none is listed.
    const char* countFailed;
    const char* countOpen;
    const char* countPassed;
    const char* noCriterion;

    const char* hash;
    const char* madeBy;
    const char* signature;

    const char* certificate;
    const char* conditions;
    const char* differences;
    const char* differencesAxis;
    const char* worstPatches;
    const char* patch;
    const char* targetColour;
    const char* measuredColour;
    const char* swatches;
    const char* colours;
    const char* warnings;
    const char* moreWarnings;
    const char* viewing;
    const char* page;
};

const Texts& texts();

/// "PASSED", "FAILED", "INCOMPLETE".
const char* verdictText(report::Verdict verdict);

/// A text with "{name}" replaced by the value of that name.
std::string filled(std::string_view text,
                   std::initializer_list<std::pair<std::string_view, std::string>> values);

/// Fixed decimals; a dash if the number is not finite.
std::string numberText(double value, int decimals);

/// 2024-05-01T12:34:56+02:00, or a beginning of it, as "1 May 2024, 12:34 (UTC+02:00)". Any other
/// text is returned unchanged.
std::string dateText(const std::string& stamp);

/// What a layout can take: invalid UTF-8 becomes U+FFFD, control characters and line ends become
/// blanks, characters that turn the direction of writing are removed, runs of blanks become one,
/// and text after `longestText` characters is replaced by an ellipsis.
std::string printable(std::string_view text);

inline constexpr std::size_t longestText = 400;

} // namespace label
