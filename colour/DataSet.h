// SPDX-License-Identifier: Apache-2.0
// A set of patches, the result of a reader and the input of a comparison.
#pragma once

#include <cstddef>
#include <cstdint>
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
    int length = 0; ///< 0 if there are no spectra.
};

/// The kind of the device values.
enum class DeviceSpace {
    None,
    Cmyk, ///< The first four channels are C, M, Y, K; others are spot colours.
    Rgb,
    Other, ///< nCLR and similar, without recognisable process colours.
};

/// Conditions as stated by a file; empty if not stated.
struct Conditions {
    std::string illuminant;  ///< "D50"
    std::string observer;    ///< "2" or "10" (degrees)
    std::string measurement; ///< "M0" to "M3"
    bool operator==(const Conditions&) const = default;

    /// False if the stated illuminant is not D50 or the stated observer is not 2 degrees.
    bool areUsual() const {
        return (illuminant.empty() || illuminant == "D50") && (observer.empty() || observer == "2");
    }
};

/// Structure of arrays: row i of every non-empty array belongs to patch i.
struct DataSet {
    std::size_t patchCount = 0;
    std::vector<std::string> ids;   ///< SAMPLE_ID as written, UTF-8; may be empty.
    std::vector<std::string> names; ///< SAMPLE_NAME as written, UTF-8; may be empty.

    DeviceSpace deviceSpace = DeviceSpace::None;
    std::vector<std::string> channels; ///< Names of the device channels, such as "CMYK_C".
    std::vector<double> device;        ///< channels.size() values per patch, 0 to 100.

    // If a file states an illuminant other than D50 or an observer other than 2 degrees, both are
    // from the spectra, if usable.
    std::vector<Lab> lab; ///< As stated by the file, or else from xyz, or else from spectra.
    std::vector<Xyz> xyz; ///< As stated by the file, or else from spectra, or else from lab.

    SpectralAxis axis;
    std::vector<double>
        spectra; ///< axis.length reflectances per patch, 0 to 1 (brighteners exceed 1).
    /// The only rows that have spectra, rising, if not all have (CgatsWants::singleInks).
    std::vector<std::uint32_t> spectrumRows;

    /// Reflectances of a row; null if it has none.
    const double* spectrumOf(std::size_t row) const;

    std::string originator; ///< Header texts in UTF-8; empty if absent.
    std::string descriptor;
    std::string created;
    std::string instrumentation;
    std::string printing;    ///< The printer, or else the printing conditions.
    Conditions conditions;   ///< As stated.
    bool calculated = false; ///< lab and xyz are from the spectra, since the file states another
                             ///< illuminant than D50 or observer than 2 degrees.

    std::vector<std::string> notes; ///< The reader's assumptions and repairs, for people.

    bool hasColour() const { return !lab.empty(); }
    bool hasDevice() const { return deviceSpace != DeviceSpace::None; }
    bool hasCmyk() const { return deviceSpace == DeviceSpace::Cmyk; }
};

/// Keeps only what identifies the patches: ids, names and device values.
DataSet chartOf(DataSet set);

} // namespace colour
