// SPDX-License-Identifier: Apache-2.0
// Which instrument measures, and how: the settings file.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "colour/DataSet.h"

namespace measuretool {

/// What goes wrong on purpose, for tests and training.
enum class Mishap { None, Fail, Cancel, Hang, Crash };

struct Settings {
    enum class Instrument { None, Virtual, File };
    Instrument instrument = Instrument::None;

    // The virtual instrument.
    std::string profile;    ///< Of the printing condition.
    double error = 0;       ///< Mean CIELAB difference (CIE76) that the random error makes.
    colour::Lab bias;       ///< What every patch is off by.
    std::uint64_t seed = 1; ///< The same seed gives the same errors.
    bool spectra = false;   ///< Whether spectra are measured too.

    // The exported measurement.
    std::string file;
    std::chrono::seconds wait{0}; ///< For a new file; 0: the one that is there is taken.
    bool bareIds = false; ///< Whether ids that are the numbers 1 to N prove the right strip.

    // Both.
    std::chrono::milliseconds delay{0}; ///< Time that a patch takes.
    Mishap mishap = Mishap::None;
    std::optional<std::size_t> mishapAt; ///< Number of the patch, from 1; else the middle one.
};

/// The settings file of this run: what TINTGATE_MEASURE names, else
/// Library/Preferences/NerovaMeasure.conf below the system root, else tintgate/measure.conf in the
/// user's configuration folder. Throws Failure (BadSettings) if there is none.
///
/// There are no default settings: a file without an instrument must not lead to values that nobody
/// has measured.
std::string settingsPath();

/// Reads a settings file; the paths in it are made relative to its folder. Throws Failure
/// (BadSettings), with the line, for whatever is not as described in docs/measuring.md.
Settings readSettings(const std::string& path);

} // namespace measuretool
