// SPDX-License-Identifier: Apache-2.0
// What the columns of a table mean, told from their names as instruments, profilers and
// spreadsheets write them.
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
    Name,          ///< index: as for Id.
    Cmyk,          ///< index: 0 to 3.
    Spot,          ///< A colorant beside C, M, Y and K.
    Rgb,           ///< index: 0 to 2.
    Colorant,      ///< 7CLR_1 and the like; index: from 0.
    OtherDevice,   ///< CMY without black, grey.
    Lab,           ///< index: 0 to 2.
    Xyz,           ///< index: 0 to 2.
    Spectral,      ///< index: wavelength in nm.
    Wavelength,    ///< SPECTRAL_NM: its cells hold the wavelength of the value that follows.
    SpectralValue, ///< SPECTRAL_PCT or SPECTRAL_DEC behind a SPECTRAL_NM.
    CurveInput,    ///< RGB_I and the like.
    RowIndex,      ///< INDEX.
};

/// What a name says of the scale of its spectral values.
enum class SpectralUnit : std::uint8_t { Unstated, Percent, Fraction };

struct ColumnMeaning {
    Quantity quantity = Quantity::Unknown;
    int index = 0;
    SpectralUnit unit = SpectralUnit::Unstated;
};

/// Meaning of each column. Single letters (C M Y K, R G B, L a b, X Y Z) and ink names in full
/// count only where the whole group stands side by side.
std::vector<ColumnMeaning> meaningsOf(const std::vector<std::string>& names);

/// True if the name of a channel only numbers its ink: 7CLR_5, PC7_5, PCA_A, CMYK_5, SPOT_5. Others
/// name it, such as CMYKOG_O and SPOT_Gold.
bool isNumberedInk(std::string_view channel);

/// True if the names hold a whole group of colour or device values. Only this tells a line of names
/// from prose.
bool holdWholeGroup(const std::vector<ColumnMeaning>& meanings);

/// What the rows of a table are.
enum class TableKind : std::uint8_t {
    Patches,
    Extremes, ///< Numbered by INDEX: density extremes and ink combinations beside the patches.
    Curve,    ///< A calibration curve: RGB_I and the like.
};

/// What to do with the cells of one column.
struct Column {
    enum Kind : std::uint8_t { Skip, Number, Id, Name };
    Kind kind = Skip;
    std::uint16_t slot = 0; ///< Of a Number: its place among the row's values.
};

/// Values that stand side by side among the values of a row.
struct Group {
    std::size_t first = 0;
    std::size_t count = 0;
    bool contains(std::size_t slot) const { return slot - first < count; }
};

/// How the rows of a table are read. The values of a row stand in the order device, XYZ, Lab,
/// spectra by rising wavelength, stated wavelengths.
struct Layout {
    std::vector<Column> columns; ///< In the file's order.
    std::size_t valueCount = 0;
    Group device;
    Group xyz;
    Group lab;
    Group spectra;
    Group wavelengths;
    std::vector<double> statedWavelengths; ///< What every row must hold in `wavelengths`.

    bool hasIds = false;
    bool hasNames = false;
    DeviceSpace deviceSpace = DeviceSpace::None;
    std::vector<std::string> channels;
    SpectralAxis axis;
    SpectralUnit unit = SpectralUnit::Unstated;
    bool unevenSpectra = false; ///< There are spectra, but on no even axis; they are skipped.
    TableKind kind = TableKind::Patches;
    std::vector<std::string> notes;
};

/// `firstRow` holds the numbers of the first row where they are numbers (0 elsewhere); it is looked
/// at for SPECTRAL_NM columns alone. Without `wantSpectra` they are read only where there is
/// neither Lab nor XYZ.
Layout layoutOf(const std::vector<std::string>& names, const std::vector<double>& firstRow,
                bool wantSpectra);

} // namespace colour::cgats
