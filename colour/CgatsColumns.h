// SPDX-License-Identifier: Apache-2.0
// The meaning of a table's columns, derived from names as instruments, profilers and spreadsheets
// write them.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "colour/DataSet.h"

namespace colour::cgats {

enum class Quantity : std::uint8_t {
    Unknown,
    Id,            ///< index: rank among the spellings, 0 is the best.
    Name,          ///< index: same as for Id.
    Cmyk,          ///< index: 0 to 3.
    Spot,          ///< A colorant in addition to C, M, Y and K.
    Rgb,           ///< index: 0 to 2.
    Colorant,      ///< 7CLR_1 and similar; index: from 0.
    OtherDevice,   ///< CMY without black, grey.
    Lab,           ///< index: 0 to 2.
    Xyz,           ///< index: 0 to 2.
    Spectral,      ///< index: wavelength in nm.
    Wavelength,    ///< SPECTRAL_NM: its cells contain the wavelength of the next value.
    SpectralValue, ///< SPECTRAL_PCT or SPECTRAL_DEC after a SPECTRAL_NM.
    CurveInput,    ///< RGB_I and similar.
    RowIndex,      ///< INDEX.
};

/// The scale of spectral values according to a column's name.
enum class SpectralUnit : std::uint8_t { Unstated, Percent, Fraction };

struct ColumnMeaning {
    Quantity quantity = Quantity::Unknown;
    int index = 0;
    SpectralUnit unit = SpectralUnit::Unstated;
};

/// Meaning of each column. Single letters (C M Y K, R G B, L a b, X Y Z) and full ink names count
/// only if the whole group is in adjacent columns.
std::vector<ColumnMeaning> meaningsOf(const std::vector<std::string>& names);

/// True if the name of a channel only numbers its ink: 7CLR_5, PC7_5, PCA_A, CMYK_5, SPOT_5. False
/// if it names the ink, such as CMYKOG_O and SPOT_Gold.
bool isNumberedInk(std::string_view channel);

/// True if the names include a whole group of colour or device values. Only this distinguishes a
/// line of names from prose.
bool holdWholeGroup(const std::vector<ColumnMeaning>& meanings);

/// The kind of data in a table's rows.
enum class TableKind : std::uint8_t {
    Patches,
    Extremes, ///< Numbered by INDEX: density extremes and ink combinations.
    Curve,    ///< A calibration curve: RGB_I and similar.
};

/// How to read the cells of one column.
struct Column {
    enum Kind : std::uint8_t { Skip, Number, Id, Name };
    Kind kind = Skip;
    std::uint16_t slot = 0; ///< For a Number: its index in the row's values.
};

/// Adjacent values among the values of a row.
struct Group {
    std::size_t first = 0;
    std::size_t count = 0;
    bool contains(std::size_t slot) const { return slot - first < count; }
};

/// How to read the rows of a table. A row's values are in this order: device, XYZ, Lab, spectra by
/// ascending wavelength, stated wavelengths.
struct Layout {
    std::vector<Column> columns; ///< In the file's order.
    std::size_t valueCount = 0;
    Group device;
    Group xyz;
    Group lab;
    Group spectra;
    Group wavelengths;
    std::vector<double> statedWavelengths; ///< Required values of `wavelengths`.

    bool hasIds = false;
    bool hasNames = false;
    DeviceSpace deviceSpace = DeviceSpace::None;
    std::vector<std::string> channels;
    SpectralAxis axis;
    SpectralUnit unit = SpectralUnit::Unstated;
    bool unevenSpectra = false; ///< There are spectra without an even axis; they are skipped.
    TableKind kind = TableKind::Patches;
    std::vector<std::string> notes;
};

/// `firstRow` contains the numbers of the first row, and 0 for cells that are not numbers. It is
/// used only for SPECTRAL_NM columns. Without `wantSpectra`, spectra are read only if there is
/// neither Lab nor XYZ.
Layout layoutOf(const std::vector<std::string>& names, const std::vector<double>& firstRow,
                bool wantSpectra);

} // namespace colour::cgats
