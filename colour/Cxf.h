// SPDX-License-Identifier: Apache-2.0
// Reads CxF3 (ISO 17972-1), the XML exported by current instruments and their programs.
#pragma once

#include <string_view>

#include "colour/CgatsText.h"
#include "colour/DataSet.h"
#include "colour/Failure.h"

namespace colour {

/// True if the bytes are XML, UTF-16 included, with the root element of CxF. Older versions of the
/// format are different; they count as CxF here, and the reader refuses them.
bool looksLikeCxf(std::string_view bytes);

/// Reads the objects of a file as patches, in the order of the objects with device values, or else
/// in the file's order.
///
/// If a file has targets (only device values) and measurements (only colours), they are joined by
/// position on the sheet, or else by sample id, name or id, whichever joins most, or else by order.
/// Repeated measurements of a target are separate patches. If there are several measurement
/// conditions, the one named by `wants` is read, or else the first of M1, M0, M2, M3. Only the
/// file's actual content counts, not its statements about its content.
///
/// Scales, derived values and the data set are those of readCgats. On failure, `set` is unchanged.
Failure readCxf(std::string_view bytes, const CgatsWants& wants, DataSet& set);

} // namespace colour
