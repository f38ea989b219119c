// SPDX-License-Identifier: Apache-2.0
// Identifies the target colours of a file by a short text: equal texts mean equal targets.
#pragma once

#include <string>

#include "colour/ColourFile.h"

namespace colour {

/// 32 hexadecimal digits: XXH3 (128 bits, canonical order) over the number of device channels, then
/// for each patch in order its device values in 1/10000 percent and its L*a*b* in 1/1000, rounded
/// to the nearest (halves to even), all as 32-bit little-endian integers. Headers, ids, names,
/// spectra and the file format do not count. A set without colour values has no identity (empty).
/// The hash distinguishes different targets; it does not protect against forgery.
std::string identityOf(const DataSet& set);

/// The identity of the patches of all combinations of 0, 20, ... 100 percent C, M, Y, K (K varies
/// fastest) as the profile evaluates them; empty if it can't.
std::string identityOf(const Profile& profile);

/// Of whichever the file contains.
std::string identityOf(const ColourFile& file);

} // namespace colour
