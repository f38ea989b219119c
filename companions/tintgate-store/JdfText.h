// SPDX-License-Identifier: Apache-2.0
// Prepares a JDF's text so that updates leave it intact.
//
// The update of a JDF works on text, and its deletion is faulty: it duplicates the text to delete
// and removes twice as much from the end of the file. It deletes
//
//   <Sender printdate="2024-05-31"        an existing date, to replace it
//   <tazo:MeasurementData ID="BJDFLink0000006" Class="Parameter" Status="Available">
//                                         its own element with all its content
//
// and if "</ResourceLinkPool>" or "</ResourcePool>" is missing, it writes at the very beginning. In
// a prepared text it deletes only the dates of its own earlier updates, and loses only blanks at
// the end:
//
//   <Sender printdate="" printtime=""/>
//   <ResourcePool> ...
//   <tazo:MeasurementData Class="Parameter" ID="BJDFLink0000006" Status="Available">
//   </tazo:MeasurementData>
//   </ResourcePool>
//   <ResourceLinkPool> ... <tazo:MeasurementDataLink rRef="BJDFLink0000006" Usage="Input"/>
//
// For an XML reader this is the same element, but the search for the original tag does not find it.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace admin {

/// Each update makes a date longer than twice its former length, and the next one loses twice that.
/// So each update needs twice the blanks: 2,052 for six, 2.4 million for sixteen.
inline constexpr int mostUpdates = 16;
inline constexpr int usualUpdates = 8;

/// A larger JDF is not processed, because all of it is in memory several times.
inline constexpr std::size_t largestJdf = std::size_t{256} << 20;

/// Whether the text is well-formed XML and can be processed. Here and below, spectral values count
/// as if the blanks between them, which are never written, were there.
bool isSound(std::string_view jdf);

struct PreparedJdf {
    std::string text;
    std::vector<std::string> changes; ///< For people, past tense. Empty if it was prepared already.
};

/// Prepares a text for `updates` updates of any strip or job. The rest of the text is unchanged
/// except for one blank: another element's attribute that the update would mistake for a date of
/// the Sender or Receiver is written as `printdate =""`. Throws Failure: JdfNotSound if the text is
/// not well-formed or the update would still find its tokens in the wrong place; JdfTooLarge beyond
/// the limits above and for more than mostXmlElements.
PreparedJdf prepared(const std::string& jdf, int updates);

/// The part of a prepared text that updates don't change: without measurements, their elements and
/// the links to these, dates, and all blanks. It is equal for all texts of one delivery.
std::string unchangedPart(std::string_view prepared);

/// The measurements in a text, well-formed or not, as written. Truncated ones are left out.
std::vector<std::string> measurementsIn(std::string_view jdf);

/// Appends measurements to their element in a prepared text.
std::string withMeasurements(std::string jdf, const std::vector<std::string>& measurements);

} // namespace admin
