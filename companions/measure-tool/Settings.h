// SPDX-License-Identifier: Apache-2.0
// The settings file: the instrument and its parameters.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "colour/DataSet.h"

namespace measuretool {

/// Deliberate failures, for tests and training.
enum class Mishap { None, Fail, Cancel, Hang, Crash };

struct Settings {
    enum class Instrument { None, Virtual, File };
    Instrument instrument = Instrument::None;

    // The virtual instrument.
    std::string profile;    ///< Profile of the printing condition.
    double error = 0;       ///< Mean CIELAB difference (CIE76) caused by the random error.
    colour::Lab bias;       ///< Added to every patch.
    std::uint64_t seed = 1; ///< The same seed gives the same errors.
    bool spectra = false;   ///< Whether spectra are measured too.

    // The exported measurement.
    std::string file;
    std::chrono::seconds wait{0}; ///< Time to wait for a new file; 0 takes the existing one.
    bool bareIds = false;         ///< Whether ids 1 to N are enough to identify the strip.

    // Both instruments.
    std::chrono::milliseconds delay{0}; ///< Time per patch.
    Mishap mishap = Mishap::None;
    std::optional<std::size_t> mishapAt; ///< Number of the patch, from 1; if empty, the middle one.
};

/// The settings file of this run, the first of: the value of TINTGATE_MEASURE;
/// Library/Preferences/NerovaMeasure.conf below the system root; tintgate/measure.conf in the
/// user's configuration folder. Throws Failure (BadSettings) if there is none.
///
/// There are no default settings: a file without an instrument must not produce values that nobody
/// has measured.
std::string settingsPath();

/// Reads a settings file and resolves its relative paths against its folder. Throws Failure
/// (BadSettings), with the line, for anything not described in docs/measuring.md.
Settings readSettings(const std::string& path);

} // namespace measuretool
