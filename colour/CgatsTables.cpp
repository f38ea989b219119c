// SPDX-License-Identifier: Apache-2.0
#include "colour/CgatsTables.h"

#include <algorithm>
#include <cmath>
#include <numeric>
#include <string_view>
#include <unordered_map>

#include "colour/Difference.h"
#include "colour/Spectra.h"

namespace colour::cgats {

namespace {

// Maximum values of a column with the scale 0 to 1. Brightened paper reflects up to 1.3 at its
// bluest wavelengths, and fluorescent inks more; its Z stays below 1.1.
constexpr double largestXyzOfOne = 1.2;
constexpr double largestReflectance = 2.0;

// Rounded device values can slightly exceed their range.
constexpr double largestPercent = 101;
constexpr double largestByte = 255.5;
constexpr double smallestWord = 4096; ///< A 16-bit chart has a value above this.
constexpr double largestWord = 65535.5;

/// Limit of all colour and device values. Sums and squares of such numbers stay finite.
constexpr double largestValue = 1e9;

/// Number of rows compared to determine a scale, spread over the whole table.
constexpr std::size_t comparedRows = 4096;

bool isZero(const Lab& lab) {
    return lab.L == 0 && lab.a == 0 && lab.b == 0;
}

bool isZero(const Xyz& xyz) {
    return xyz.X == 0 && xyz.Y == 0 && xyz.Z == 0;
}

bool isZero(double value) {
    return value == 0;
}

template<typename T>
bool allZero(const std::vector<T>& values) {
    return std::all_of(values.begin(), values.end(), [](const T& value) { return isZero(value); });
}

bool inRange(const DataSet& set) {
    const auto fits = [](double value) { return std::abs(value) <= largestValue; };
    return std::all_of(set.device.begin(), set.device.end(), fits) &&
           std::all_of(set.spectra.begin(), set.spectra.end(), fits) &&
           std::all_of(set.xyz.begin(), set.xyz.end(),
                       [&](const Xyz& xyz) { return fits(xyz.X) && fits(xyz.Y) && fits(xyz.Z); }) &&
           std::all_of(set.lab.begin(), set.lab.end(),
                       [&](const Lab& lab) { return fits(lab.L) && fits(lab.a) && fits(lab.b); });
}

bool holdsPatches(const Table& table) {
    const DataSet& set = table.set;
    return table.kind == TableKind::Patches &&
           (!set.device.empty() || !set.xyz.empty() || !set.lab.empty() || !set.spectra.empty());
}

// Joining ------------------------------------------------------------------------------------

/// For each row of `first`, the row of `next` with the same label; equal labels are paired in
/// order. Empty if the labels differ.
std::vector<std::size_t> matchLabels(const std::vector<std::string>& first,
                                     const std::vector<std::string>& next) {
    std::vector<std::size_t> rows(first.size());
    std::iota(rows.begin(), rows.end(), std::size_t{0});
    if (first == next) {
        return rows;
    }
    // For each label, a chain of its rows, in their order.
    std::unordered_map<std::string_view, std::size_t> heads;
    std::vector<std::size_t> following(next.size());
    for (std::size_t row = next.size(); row-- > 0;) {
        const auto [head, isNew] = heads.try_emplace(next[row], next.size());
        following[row] = head->second;
        head->second = row;
    }
    for (std::size_t row = 0; row < first.size(); ++row) {
        const auto head = heads.find(first[row]);
        if (head == heads.end() || head->second == next.size()) {
            return {};
        }
        rows[row] = head->second;
        head->second = following[head->second];
    }
    return rows;
}

/// For each row of `first`, the row of `next` with the same patch. Empty if the patches differ.
std::vector<std::size_t> matchRows(const DataSet& first, const DataSet& next) {
    if (first.patchCount != next.patchCount) {
        return {};
    }
    std::vector<std::size_t> rows;
    if (!first.ids.empty() && !next.ids.empty()) {
        rows = matchLabels(first.ids, next.ids);
    } else if (!first.names.empty() && !next.names.empty()) {
        rows = matchLabels(first.names, next.names);
    } else {
        rows.resize(first.patchCount);
        std::iota(rows.begin(), rows.end(), std::size_t{0});
    }
    if (rows.empty() || first.device.empty() || next.device.empty() ||
        first.channels != next.channels) {
        return rows;
    }
    const std::size_t channels = first.channels.size();
    for (std::size_t row = 0; row < rows.size(); ++row) {
        const auto here = first.device.begin() + static_cast<std::ptrdiff_t>(row * channels);
        const auto there = next.device.begin() + static_cast<std::ptrdiff_t>(rows[row] * channels);
        if (!std::equal(here, here + static_cast<std::ptrdiff_t>(channels), there)) {
            return {};
        }
    }
    return rows;
}

/// Moves `width` values per row to `target` if it is empty. True if there were any to move.
template<typename T>
bool takeColumns(std::vector<T>& target, std::vector<T>& source,
                 const std::vector<std::size_t>& rows, std::size_t width) {
    if (!target.empty() || source.empty()) {
        return false;
    }
    target.reserve(source.size());
    for (const std::size_t row : rows) {
        for (std::size_t i = 0; i < width; ++i) {
            target.push_back(std::move(source[row * width + i]));
        }
    }
    return true;
}

bool takeAllColumns(Table& first, Table& next, const std::vector<std::size_t>& rows) {
    DataSet& set = first.set;
    DataSet& other = next.set;
    bool taken = false;
    if (takeColumns(set.device, other.device, rows, other.channels.size())) {
        set.deviceSpace = other.deviceSpace;
        set.channels = std::move(other.channels);
        taken = true;
    }
    if (takeColumns(set.spectra, other.spectra, rows,
                    static_cast<std::size_t>(other.axis.length))) {
        set.axis = other.axis;
        first.unit = next.unit;
        taken = true;
    }
    taken |= takeColumns(set.xyz, other.xyz, rows, 1);
    taken |= takeColumns(set.lab, other.lab, rows, 1);
    if (taken) {
        takeColumns(set.names, other.names, rows, 1);
        takeColumns(set.ids, other.ids, rows, 1);
    }
    return taken;
}

bool sameColumns(const Table& first, const Table& next) {
    const DataSet& a = first.set;
    const DataSet& b = next.set;
    const auto sameShape = [](const auto& left, const auto& right) {
        return left.empty() == right.empty();
    };
    return a.deviceSpace == b.deviceSpace && a.channels == b.channels &&
           a.axis.base == b.axis.base && a.axis.step == b.axis.step &&
           a.axis.length == b.axis.length && first.unit == next.unit && sameShape(a.ids, b.ids) &&
           sameShape(a.names, b.names) && sameShape(a.xyz, b.xyz) && sameShape(a.lab, b.lab) &&
           sameShape(a.spectra, b.spectra);
}

template<typename T>
void appendTo(std::vector<T>& target, std::vector<T>& source) {
    target.insert(target.end(), std::make_move_iterator(source.begin()),
                  std::make_move_iterator(source.end()));
}

void appendRows(DataSet& set, DataSet& more) {
    set.patchCount += more.patchCount;
    appendTo(set.ids, more.ids);
    appendTo(set.names, more.names);
    appendTo(set.device, more.device);
    appendTo(set.xyz, more.xyz);
    appendTo(set.lab, more.lab);
    appendTo(set.spectra, more.spectra);
}

// Scales -------------------------------------------------------------------------------------

/// Y, of 100, for an L* (CIE 15).
double luminanceOf(double lightness) {
    return xyzFromLab({lightness, 0, 0}).Y;
}

std::size_t strideOver(std::size_t rows) {
    return std::max<std::size_t>(1, rows / comparedRows);
}

/// The sum of Y, of 100, of the compared rows, from Lab or else XYZ; 0 if there is neither.
double statedLuminance(const DataSet& set) {
    double sum = 0;
    for (std::size_t row = 0; row < set.patchCount; row += strideOver(set.patchCount)) {
        if (!set.lab.empty()) {
            sum += luminanceOf(set.lab[row].L);
        } else if (!set.xyz.empty()) {
            sum += set.xyz[row].Y;
        }
    }
    return sum;
}

void scaleXyz(DataSet& set, ScaleHint hint, Notes& notes) {
    if (hint == ScaleHint::NeverOfOne) {
        return;
    }
    double largest = 0;
    double sum = 0;
    for (const Xyz& xyz : set.xyz) {
        largest = std::max({largest, xyz.X, xyz.Y, xyz.Z});
    }
    for (std::size_t row = 0; row < set.xyz.size(); row += strideOver(set.patchCount)) {
        sum += set.xyz[row].Y;
    }
    const double expected = set.lab.empty() ? 0 : statedLuminance(set);
    const bool ofOne = expected > 0 && sum > 0 ? sum < expected / 10 : largest <= largestXyzOfOne;
    if (!ofOne || largest <= 0) {
        return;
    }
    for (Xyz& xyz : set.xyz) {
        xyz = {100 * xyz.X, 100 * xyz.Y, 100 * xyz.Z};
    }
    notes.add("XYZ is taken as 0 to 1.");
}

/// True if the spectra are in percent.
bool spectraInPercent(const Table& table) {
    const DataSet& set = table.set;
    const double largest = *std::max_element(set.spectra.begin(), set.spectra.end());
    if (largest > 10 * largestReflectance) {
        return true;
    }
    if (spectraUsable(set.axis)) {
        const SpectralWeights weights(set.axis);
        const auto length = static_cast<std::size_t>(set.axis.length);
        double sum = 0;
        for (std::size_t row = 0; row < set.patchCount; row += strideOver(set.patchCount)) {
            sum += weights.xyz(set.spectra.data() + row * length).Y;
        }
        const double expected = statedLuminance(set);
        if (expected > 0 && sum > 0) {
            return sum > 10 * expected;
        }
    }
    return largest > largestReflectance || table.unit == SpectralUnit::Percent;
}

void scaleSpectra(Table& table, Notes& notes) {
    if (!spectraInPercent(table)) {
        return;
    }
    for (double& value : table.set.spectra) {
        value /= 100;
    }
    if (table.unit != SpectralUnit::Percent) {
        notes.add("Spectra are taken as 0 to 100.");
    }
}

void scaleDevice(DataSet& set, ScaleHint hint, Notes& notes) {
    const double largest = *std::max_element(set.device.begin(), set.device.end());
    double full = 100;
    if (largest > 0 && largest <= 1 && hint != ScaleHint::NeverOfOne) {
        full = 1;
    } else if (largest > largestPercent && largest <= largestByte) {
        full = 255;
    } else if (largest >= smallestWord && largest <= largestWord) {
        full = 65535;
    } else if (largest > largestByte) {
        notes.add("Device values go up to " + std::to_string(std::lround(largest)) +
                  " and are used unchanged.");
    }
    if (full == 100) {
        return;
    }
    for (double& value : set.device) {
        value =
            value * 100 / full; // in this order 255 gives 100, and percents are restored exactly
    }
    notes.add("Device values are taken as 0 to " + std::to_string(std::lround(full)) + ".");
}

// Derived values -----------------------------------------------------------------------------

/// If all values of a column are zero and other columns have values, it was not measured: stores
/// without a value write zeros.
void dropZeroColumns(DataSet& set, Notes& notes) {
    const bool lab = !set.lab.empty() && !allZero(set.lab);
    const bool xyz = !set.xyz.empty() && !allZero(set.xyz);
    const bool spectra = !set.spectra.empty() && !allZero(set.spectra);
    if (!lab && !xyz && !spectra) {
        return;
    }
    const char* const remark = " is zero throughout and counts as absent.";
    if (!lab && !set.lab.empty()) {
        set.lab.clear();
        notes.add(std::string("Lab") + remark);
    }
    if (!xyz && !set.xyz.empty()) {
        set.xyz.clear();
        notes.add(std::string("XYZ") + remark);
    }
    if (!spectra && !set.spectra.empty()) {
        set.spectra.clear();
        set.axis = {};
        notes.add(std::string("The spectrum of every patch") + remark);
    }
}

/// REQUIRES: usable spectra.
void xyzFromSpectra(DataSet& set) {
    const SpectralWeights weights(set.axis);
    const auto length = static_cast<std::size_t>(set.axis.length);
    set.xyz.resize(set.patchCount);
    for (std::size_t row = 0; row < set.patchCount; ++row) {
        set.xyz[row] = weights.xyz(set.spectra.data() + row * length);
    }
}

Failure deriveColour(DataSet& set) {
    const bool usable = !set.spectra.empty() && spectraUsable(set.axis);
    if (set.lab.empty() && set.xyz.empty() && !set.spectra.empty() && !usable) {
        return Failure::SpectraUnusable;
    }
    if (set.xyz.empty() && usable) {
        xyzFromSpectra(set);
    }
    if (set.lab.empty()) {
        set.lab.resize(set.xyz.size());
        std::transform(set.xyz.begin(), set.xyz.end(), set.lab.begin(), labFromXyz);
    } else if (set.xyz.empty()) {
        set.xyz.resize(set.lab.size());
        std::transform(set.lab.begin(), set.lab.end(), set.xyz.begin(), xyzFromLab);
    }
    return Failure::None;
}

} // namespace

void joinTable(Table& first, Table&& next, Notes& notes) {
    if (!holdsPatches(next)) {
        notes.add("A further table without patches is left out.");
        return;
    }
    if (!holdsPatches(first)) {
        notes.add("A table without patches is left out.");
        first = std::move(next);
        return;
    }
    const std::vector<std::size_t> rows = matchRows(first.set, next.set);
    if (!rows.empty()) {
        if (!takeAllColumns(first, next, rows)) {
            notes.add("A further table repeats the same patches and is left out.");
        }
    } else if (sameColumns(first, next)) {
        appendRows(first.set, next.set);
        notes.add("Several tables are joined into one.");
    } else {
        notes.add("A further table with other patches and columns is left out.");
    }
}

Failure complete(Table& table, ScaleHint hint, const CgatsWants& wants, Notes& notes) {
    DataSet& set = table.set;
    if (set.patchCount == 0 || table.kind == TableKind::Curve) {
        return Failure::NoPatches;
    }
    if (!inRange(set)) {
        return Failure::NotNumeric;
    }
    dropZeroColumns(set, notes);
    if (hint != ScaleHint::Stated) {
        if (!set.xyz.empty()) {
            scaleXyz(set, hint, notes);
        }
        if (!set.spectra.empty()) {
            scaleSpectra(table, notes);
        }
        if (!set.device.empty()) {
            scaleDevice(set, hint, notes);
        }
    }

    const bool stated = !set.lab.empty() || !set.xyz.empty();
    if (!stated && set.spectra.empty() && table.unevenSpectra) {
        return Failure::SpectraUnusable;
    }
    if (!stated && set.spectra.empty()) {
        return set.device.empty() ? Failure::NoColourValues : Failure::None;
    }
    if (wants.calculated && !set.spectra.empty() && spectraUsable(set.axis)) {
        set.lab.clear();
        set.xyz.clear();
        set.calculated = true;
    }
    const Failure failure = deriveColour(set);
    if (!wants.spectra && stated) {
        set.spectra = {};
        set.axis = {};
    }
    return failure;
}

} // namespace colour::cgats
