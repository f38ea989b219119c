// SPDX-License-Identifier: Apache-2.0
// A set of patches as a reader gives it and a comparison takes it.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace colour {

/// CIELAB under D50 for the 2 degree observer.
struct Lab {
    double L = 0;
    double a = 0;
    double b = 0;
    bool operator==(const Lab&) const = default;
};

/// CIE XYZ under D50 for the 2 degree observer; Y of the perfect diffuser is 100.
struct Xyz {
    double X = 0;
    double Y = 0;
    double Z = 0;
};

/// Wavelengths of a set's spectra: base, base + step, ... in nm.
struct SpectralAxis {
    int base = 0;
    int step = 0;
    int length = 0; ///< 0: no spectra.
};

/// What the device values are.
enum class DeviceSpace {
    None,
    Cmyk, ///< The first four channels are C, M, Y, K; further ones are spot colours.
    Rgb,
    Other, ///< nCLR and the like, without process colours that could be told.
};

/// Conditions that a file states in its own words; empty where it states none.
struct Conditions {
    std::string illuminant;  ///< "D50"
    std::string observer;    ///< "2" or "10" (degrees)
    std::string measurement; ///< "M0" to "M3"
    bool operator==(const Conditions&) const = default;

    /// False if the illuminant or observer stated is another than D50 or 2 degrees.
    bool areUsual() const {
        return (illuminant.empty() || illuminant == "D50") && (observer.empty() || observer == "2");
    }
};

/// Structure of arrays: row i of every array that is not empty belongs to patch i.
struct DataSet {
    std::size_t patchCount = 0;
    std::vector<std::string> ids;   ///< SAMPLE_ID as written, UTF-8; empty without such a column.
    std::vector<std::string> names; ///< SAMPLE_NAME as written, UTF-8; empty without such a column.

    DeviceSpace deviceSpace = DeviceSpace::None;
    std::vector<std::string> channels; ///< Names of the device channels, such as "CMYK_C".
    std::vector<double> device;        ///< channels.size() values a patch, 0 to 100.

    // Of a file that states another illuminant than D50 or observer than 2 degrees both are from
    // the spectra, if it has any that can be used.
    std::vector<Lab> lab; ///< As stated by the file, else from xyz, else from spectra.
    std::vector<Xyz> xyz; ///< As stated by the file, else from spectra, else from lab.

    SpectralAxis axis;
    std::vector<double>
        spectra; ///< axis.length reflectances a patch, 0 to 1 (brighteners exceed 1).

    std::string originator; ///< Header texts, UTF-8, empty where absent.
    std::string descriptor;
    std::string created;
    std::string instrumentation;
    std::string printing;    ///< The printer, otherwise the printing conditions.
    Conditions conditions;   ///< As stated.
    bool calculated = false; ///< lab and xyz are from the spectra, since the file states another
                             ///< illuminant than D50 or observer than 2 degrees.

    std::vector<std::string>
        notes; ///< What the reader had to assume or mend, for a person to read.

    bool hasColour() const { return !lab.empty(); }
    bool hasDevice() const { return deviceSpace != DeviceSpace::None; }
    bool hasCmyk() const { return deviceSpace == DeviceSpace::Cmyk; }
};

/// Of a set only what tells its patches apart: ids, names and device values.
DataSet chartOf(DataSet set);

} // namespace colour
