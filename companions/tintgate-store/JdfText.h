// SPDX-License-Identifier: Apache-2.0
// A JDF's text, made such that updates leave it whole.
//
// The update of a JDF works on text, and its delete is none: it doubles what it was to take away
// and takes twice as much from the end of the file. It deletes
//
//   <Sender printdate="2024-05-31"        a date that is there, to put another in its place
//   <tazo:MeasurementData ID="BJDFLink0000006" Class="Parameter" Status="Available">
//                                         its own element, with all that is in it
//
// and where it misses "</ResourceLinkPool>" or "</ResourcePool>" it writes in front of all. A text
// that is prepared gives it nothing to delete but the dates of its own earlier updates, and blanks
// at the end to lose:
//
//   <Sender printdate="" printtime=""/>
//   <ResourcePool> ...
//   <tazo:MeasurementData Class="Parameter" ID="BJDFLink0000006" Status="Available">
//   </tazo:MeasurementData>
//   </ResourcePool>
//   <ResourceLinkPool> ... <tazo:MeasurementDataLink rRef="BJDFLink0000006" Usage="Input"/>
//
// The same element for an XML reader, while the search for the tag as it was no longer finds it.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace admin {

/// Each update makes a date longer than twice what it was, and the next one loses twice that. So
/// the blanks double with every update: 2,052 for six, 2.4 million for sixteen.
inline constexpr int mostUpdates = 16;
inline constexpr int usualUpdates = 8;

/// A JDF beyond this is not worked on, since the whole of it is in memory several times.
inline constexpr std::size_t largestJdf = std::size_t{256} << 20;

/// Whether the text is well-formed XML and can be worked on. Here and below, spectral values count
/// as if the blanks that they are always written without were there.
bool isSound(std::string_view jdf);

struct PreparedJdf {
    std::string text;
    std::vector<std::string> changes; ///< For people, in the past tense; none if it was prepared.
};

/// Prepares a text for so many updates, of which each may be that of any strip or job. The rest of
/// it stays byte for byte, except for one blank: an attribute of another element that the update
/// would take for a date of the Sender or Receiver is written as `printdate =""`. Throws Failure:
/// JdfNotSound for a text that is not well-formed, or in which the update would find its tokens in
/// the wrong place all the same; JdfTooLarge beyond the limits above and for more than
/// mostXmlElements.
PreparedJdf prepared(const std::string& jdf, int updates);

/// The part of a prepared text that no update changes: without measurements, the elements that
/// contain them and link to them, dates, and all blanks. Two texts of one delivery have the same.
std::string unchangedPart(std::string_view prepared);

/// The measurements in a text, well-formed or not, as they were written; those that are cut off
/// are left out.
std::vector<std::string> measurementsIn(std::string_view jdf);

/// Appends measurements to the element that holds them in a prepared text.
std::string withMeasurements(std::string jdf, const std::vector<std::string>& measurements);

} // namespace admin
