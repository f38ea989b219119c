// SPDX-License-Identifier: Apache-2.0
// Reading CxF3 (ISO 17972-1), the XML that today's instruments and their programs export.
#pragma once

#include <string_view>

#include "colour/CgatsText.h"
#include "colour/DataSet.h"
#include "colour/Failure.h"

namespace colour {

/// True if the bytes are XML, UTF-16 included, with the root element of CxF. An older version of
/// the format, which is another one, is taken for CxF here and refused by the reader.
bool looksLikeCxf(std::string_view bytes);

/// Reads the objects of a file as patches, in the order of the objects with device values, else in
/// the file's order.
///
/// If a file has targets (device values alone) and measurements (colours alone), these are joined
/// by place on the sheet, else by sample id, name, or id, whichever joins the most, else by order.
/// Repeated measurements of a target are patches of their own. Of several measurement conditions
/// the one that `wants` names is read, else M1, M0, M2, M3. What a file contains counts, whatever
/// it states of its contents.
///
/// Scales, derived values and the data set are those of readCgats. On failure `set` is left as it
/// was.
Failure readCxf(std::string_view bytes, const CgatsWants& wants, DataSet& set);

} // namespace colour
