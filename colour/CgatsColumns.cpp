// SPDX-License-Identifier: Apache-2.0
#include "colour/CgatsColumns.h"

#include <algorithm>
#include <array>
#include <optional>
#include <utility>

#include "colour/CgatsLines.h"

namespace colour::cgats {

namespace {

using Names = std::vector<std::string>;
using Meanings = std::vector<ColumnMeaning>;

// Spellings without underscores and blanks, best first: a table may have several.
constexpr std::string_view idSpellings[] = {"SAMPLEID",    "SAMPLENO", "SAMPLENUMBER", "SAMPLENR",
                                            "PATCHID",     "PATCHNO",  "PATCHNUMBER",  "PATCHNR",
                                            "SAMPLEINDEX", "ID",       "NO",           "NR"};
constexpr std::string_view nameSpellings[] = {"SAMPLENAME", "PATCHNAME",      "NAME",
                                              "SAMPLELOC",  "SAMPLELOCATION", "PATCHLOC",
                                              "LOCATION",   "SAMPLE",         "PATCH"};

struct Run {
    Quantity quantity;
    std::array<std::string_view, 4> names; ///< The last one is empty for a group of three.
    std::size_t size() const { return names[3].empty() ? 3 : 4; }
};
constexpr Run runs[] = {
    {Quantity::Cmyk, {"C", "M", "Y", "K"}},
    {Quantity::Cmyk, {"CYAN", "MAGENTA", "YELLOW", "BLACK"}},
    {Quantity::Rgb, {"R", "G", "B", ""}},
    {Quantity::Lab, {"L", "A", "B", ""}},
    {Quantity::Xyz, {"X", "Y", "Z", ""}},
};

struct SpectralPrefix {
    std::string_view name;
    SpectralUnit unit;
};
constexpr SpectralPrefix spectralPrefixes[] = {
    {"", SpectralUnit::Unstated},
    {"SPECTRAL", SpectralUnit::Unstated},
    {"SPECTRALNM", SpectralUnit::Unstated},
    {"SPECTRALPCT", SpectralUnit::Percent},
    {"SPECTRALDEC", SpectralUnit::Fraction},
    {"SPECTRUM", SpectralUnit::Unstated},
    {"SPEC", SpectralUnit::Unstated},
    {"SPECNM", SpectralUnit::Unstated},
    {"NM", SpectralUnit::Unstated},
    {"R", SpectralUnit::Unstated},
    {"REFL", SpectralUnit::Unstated},
    {"REFLECTANCE", SpectralUnit::Unstated},
    {"WL", SpectralUnit::Unstated},
    {"LAMBDA", SpectralUnit::Unstated},
};

// Wavelengths that instruments report, in nm. A truncated name gives a smaller number.
constexpr int shortestWavelength = 200;
constexpr int longestWavelength = 2500;

constexpr const char* processNames[] = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
constexpr const char* rgbNames[] = {"RGB_R", "RGB_G", "RGB_B"};

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

/// Upper case, underscores for blanks and hyphens, no asterisks, no leading CIE.
std::string normalised(std::string_view name) {
    std::string result;
    for (const char c : upperCase(name.substr(0, 256))) {
        if (c != '*') {
            result += c == ' ' || c == '-' ? '_' : c;
        }
    }
    if (result.starts_with("CIE")) {
        result.erase(0, result.starts_with("CIE_") ? 4 : 3);
    }
    return result;
}

std::string squeezed(std::string_view name) {
    std::string result(name);
    std::erase(result, '_');
    return result;
}

template<std::size_t N>
std::optional<int> rankIn(const std::string_view (&spellings)[N], std::string_view name) {
    const auto found = std::find(std::begin(spellings), std::end(spellings), name);
    if (found == std::end(spellings)) {
        return std::nullopt;
    }
    return static_cast<int>(found - std::begin(spellings));
}

/// The integer in a text of one to four digits.
std::optional<int> smallNumber(std::string_view text) {
    if (text.empty() || text.size() > 4 || !std::all_of(text.begin(), text.end(), isDigit)) {
        return std::nullopt;
    }
    int value = 0;
    for (const char c : text) {
        value = 10 * value + (c - '0');
    }
    return value;
}

/// SPECTRAL_NM380, SPEC_380, nm380, 380_NM, R_380, 380.00 and similar.
std::optional<ColumnMeaning> spectralMeaning(std::string_view squeezedName) {
    std::string_view name = squeezedName;
    const auto digit =
        static_cast<std::size_t>(std::find_if(name.begin(), name.end(), isDigit) - name.begin());
    const std::string_view prefix = name.substr(0, digit);
    const auto known = std::find_if(std::begin(spectralPrefixes), std::end(spectralPrefixes),
                                    [&](const SpectralPrefix& p) { return p.name == prefix; });
    if (known == std::end(spectralPrefixes)) {
        return std::nullopt;
    }
    name.remove_prefix(digit);
    if (name.ends_with("NM")) {
        name.remove_suffix(2);
    }
    const std::size_t point = name.find('.');
    if (point != std::string_view::npos) {
        const std::string_view decimals = name.substr(point + 1);
        if (decimals.find_first_not_of('0') != std::string_view::npos) {
            return std::nullopt;
        }
        name = name.substr(0, point);
    }
    const std::optional<int> wavelength = smallNumber(name);
    if (!wavelength || *wavelength < shortestWavelength || *wavelength > longestWavelength) {
        return std::nullopt;
    }
    return ColumnMeaning{Quantity::Spectral, *wavelength, known->unit};
}

/// Numbers above nine as a single letter, as in PCA_A: A is 10, D is 13.
std::optional<int> inkLetter(std::string_view text) {
    if (text.size() != 1 || text[0] < 'A' || text[0] > 'D') {
        return std::nullopt;
    }
    return text[0] - 'A' + 10;
}

/// 7CLR_1, CLR_1, PC7_1, PCA_A: the ink's number, from 0.
std::optional<int> colorantIndex(std::string_view name) {
    while (!name.empty() && isDigit(name.front())) {
        name.remove_prefix(1);
    }
    if (name.starts_with("CLR")) {
        name.remove_prefix(3);
    } else if (name.size() > 4 && name.starts_with("PC") && name[3] == '_' &&
               (isDigit(name[2]) || inkLetter(name.substr(2, 1)))) {
        name.remove_prefix(3);
    } else {
        return std::nullopt;
    }
    if (name.starts_with('_')) {
        name.remove_prefix(1);
    }
    const std::optional<int> letter = inkLetter(name);
    const std::optional<int> number = letter ? letter : smallNumber(name);
    if (!number || *number == 0) {
        return std::nullopt;
    }
    return *number - 1;
}

int letterIndex(std::string_view letters, std::string_view suffix) {
    return suffix.size() == 1 && letters.find(suffix[0]) != std::string_view::npos
               ? static_cast<int>(letters.find(suffix[0]))
               : -1;
}

/// Channels of CMYK and of CMYK with more inks, as in CMYK_C, CMYKOG_O, CMYKcm_c or CMYK_5.
ColumnMeaning cmykMeaning(std::string_view rawName, std::string_view prefix,
                          std::string_view suffix) {
    // Light inks have a lower-case letter; only the case distinguishes them from full inks.
    const bool lightInk = prefix.size() > 4 && suffix.size() == 1 &&
                          rawName.back() != suffix.back() && rawName.starts_with("CMYK");
    if (const int letter = letterIndex("CMYK", suffix); letter >= 0 && !lightInk) {
        return {Quantity::Cmyk, letter};
    }
    if (const auto number = smallNumber(suffix); number && *number >= 1 && *number <= 4) {
        return {Quantity::Cmyk, *number - 1};
    }
    return {Quantity::Spot};
}

ColumnMeaning meaningOf(const std::string& rawName) {
    const std::string name = normalised(rawName);
    const std::string squeezedName = squeezed(name);
    if (const auto rank = rankIn(idSpellings, squeezedName)) {
        return {Quantity::Id, *rank};
    }
    if (const auto rank = rankIn(nameSpellings, squeezedName)) {
        return {Quantity::Name, *rank};
    }
    if (const auto spectral = spectralMeaning(squeezedName)) {
        return *spectral;
    }
    if (squeezedName == "SPECTRALNM") {
        return {Quantity::Wavelength};
    }
    if (squeezedName == "SPECTRALPCT") {
        return {Quantity::SpectralValue, 0, SpectralUnit::Percent};
    }
    if (squeezedName == "SPECTRALDEC") {
        return {Quantity::SpectralValue, 0, SpectralUnit::Fraction};
    }
    if (name == "INDEX") {
        return {Quantity::RowIndex};
    }
    if (const auto index = colorantIndex(name)) {
        return {Quantity::Colorant, *index};
    }
    if (name.starts_with("SPOT")) {
        return {Quantity::Spot};
    }

    const std::size_t underscore = name.rfind('_');
    if (underscore == std::string::npos) {
        return {};
    }
    const std::string_view prefix = std::string_view(name).substr(0, underscore);
    const std::string_view suffix = std::string_view(name).substr(underscore + 1);
    const bool isDevice = prefix == "CMYK" || prefix == "RGB" || prefix == "CMY" ||
                          prefix == "GRAY" || prefix == "GREY";
    if (isDevice && suffix == "I") {
        return {Quantity::CurveInput};
    }
    if (prefix.starts_with("CMYK")) {
        return cmykMeaning(rawName, prefix, suffix);
    }
    if (prefix == "CMY" || prefix == "GRAY" || prefix == "GREY") {
        return {Quantity::OtherDevice};
    }
    constexpr std::pair<std::string_view, Quantity> families[] = {
        {"RGB", Quantity::Rgb}, {"LAB", Quantity::Lab}, {"XYZ", Quantity::Xyz}};
    for (const auto& [letters, quantity] : families) {
        if (prefix == letters && letterIndex(letters, suffix) >= 0) {
            return {quantity, letterIndex(letters, suffix)};
        }
    }
    return {};
}

/// The columns of one quantity by index, the first for each.
std::vector<std::size_t> columnsOf(const Meanings& meanings, Quantity quantity, int count) {
    std::vector<std::size_t> columns;
    for (int index = 0; index < count; ++index) {
        for (std::size_t i = 0; i < meanings.size(); ++i) {
            if (meanings[i].quantity == quantity && meanings[i].index == index) {
                columns.push_back(i);
                break;
            }
        }
    }
    return columns;
}

std::vector<std::size_t> allOf(const Meanings& meanings, Quantity quantity) {
    std::vector<std::size_t> columns;
    for (std::size_t i = 0; i < meanings.size(); ++i) {
        if (meanings[i].quantity == quantity) {
            columns.push_back(i);
        }
    }
    return columns;
}

/// The column of ids or names with the best spelling.
std::optional<std::size_t> bestOf(const Meanings& meanings, Quantity quantity) {
    std::optional<std::size_t> best;
    for (const std::size_t i : allOf(meanings, quantity)) {
        if (!best || meanings[i].index < meanings[*best].index) {
            best = i;
        }
    }
    return best;
}

Group addGroup(Layout& layout, const std::vector<std::size_t>& columns) {
    const Group group{layout.valueCount, columns.size()};
    for (const std::size_t column : columns) {
        layout.columns[column] = {Column::Number, static_cast<std::uint16_t>(layout.valueCount++)};
    }
    return group;
}

/// Five or more numbered inks are C, M, Y, K and additional inks. Four may be anything.
void takeProcessInks(Meanings& meanings) {
    constexpr int fewest = 5;
    if (columnsOf(meanings, Quantity::Cmyk, 4).empty() &&
        columnsOf(meanings, Quantity::Colorant, fewest).size() == fewest) {
        for (ColumnMeaning& meaning : meanings) {
            if (meaning.quantity == Quantity::Colorant && meaning.index < 4) {
                meaning.quantity = Quantity::Cmyk;
            }
        }
    }
}

/// The columns of inks other than C, M, Y, K: numbered ones in their order, then by position.
std::vector<std::size_t> furtherInks(const Meanings& meanings) {
    std::vector<std::size_t> columns;
    for (std::size_t i = 0; i < meanings.size(); ++i) {
        if (meanings[i].quantity == Quantity::Spot ||
            (meanings[i].quantity == Quantity::Colorant && meanings[i].index > 3)) {
            columns.push_back(i);
        }
    }
    const auto place = [&](std::size_t column) {
        return std::pair(meanings[column].quantity == Quantity::Spot, meanings[column].index);
    };
    std::stable_sort(columns.begin(), columns.end(),
                     [&](std::size_t a, std::size_t b) { return place(a) < place(b); });
    return columns;
}

void layOutDevice(const Names& names, Meanings meanings, Layout& layout) {
    takeProcessInks(meanings);
    std::vector<std::size_t> columns = columnsOf(meanings, Quantity::Cmyk, 4);
    const std::vector<std::size_t> rgb = columnsOf(meanings, Quantity::Rgb, 3);
    if (columns.size() == 4) {
        layout.deviceSpace = DeviceSpace::Cmyk;
        layout.channels.assign(std::begin(processNames), std::end(processNames));
        for (const std::size_t column : furtherInks(meanings)) {
            columns.push_back(column);
            layout.channels.push_back(toUtf8(names[column]));
        }
    } else if (rgb.size() == 3) {
        layout.deviceSpace = DeviceSpace::Rgb;
        layout.channels.assign(std::begin(rgbNames), std::end(rgbNames));
        columns = rgb;
    } else {
        columns.clear();
        for (const Quantity quantity :
             {Quantity::Colorant, Quantity::OtherDevice, Quantity::Cmyk}) {
            const std::vector<std::size_t> found = allOf(meanings, quantity);
            if (columns.empty()) {
                columns = found;
            }
        }
        for (const std::size_t spot : allOf(meanings, Quantity::Spot)) {
            columns.push_back(spot);
        }
        if (columns.empty()) {
            return;
        }
        layout.deviceSpace = DeviceSpace::Other;
        for (const std::size_t column : columns) {
            layout.channels.push_back(toUtf8(names[column]));
        }
    }
    layout.device = addGroup(layout, columns);
}

/// Converts SPECTRAL_NM / SPECTRAL_PCT pairs to plain spectral columns with the wavelengths of the
/// first row, and marks the wavelengths to be read in every row.
void resolvePairs(const std::vector<double>& firstRow, Meanings& meanings,
                  std::vector<std::size_t>& stated) {
    constexpr std::size_t none = ~std::size_t{0};
    std::size_t pending = none;
    for (std::size_t i = 0; i < meanings.size(); ++i) {
        if (meanings[i].quantity == Quantity::Wavelength) {
            pending = i;
        } else if (meanings[i].quantity == Quantity::SpectralValue && pending != none) {
            const double wavelength = pending < firstRow.size() ? firstRow[pending] : 0;
            if (wavelength >= shortestWavelength && wavelength <= longestWavelength &&
                wavelength == static_cast<int>(wavelength)) {
                meanings[i].quantity = Quantity::Spectral;
                meanings[i].index = static_cast<int>(wavelength);
                stated.push_back(pending);
            }
            pending = none;
        }
    }
}

void layOutSpectra(const std::vector<double>& firstRow, Meanings& meanings, Layout& layout) {
    std::vector<std::size_t> stated;
    resolvePairs(firstRow, meanings, stated);
    std::vector<std::size_t> columns = allOf(meanings, Quantity::Spectral);
    const auto wavelength = [&](std::size_t column) { return meanings[column].index; };
    std::stable_sort(columns.begin(), columns.end(),
                     [&](std::size_t a, std::size_t b) { return wavelength(a) < wavelength(b); });
    columns.erase(
        std::unique(columns.begin(), columns.end(),
                    [&](std::size_t a, std::size_t b) { return wavelength(a) == wavelength(b); }),
        columns.end());
    if (columns.size() < 2) {
        return;
    }
    const int base = wavelength(columns[0]);
    const int step = wavelength(columns[1]) - base;
    for (std::size_t i = 1; i < columns.size(); ++i) {
        if (wavelength(columns[i]) - wavelength(columns[i - 1]) != step) {
            layout.unevenSpectra = true;
            layout.notes.emplace_back("The wavelengths of the spectra are not evenly spaced: the "
                                      "spectra are left out.");
            return;
        }
    }
    layout.axis = {base, step, static_cast<int>(columns.size())};
    layout.unit = meanings[columns[0]].unit;
    layout.spectra = addGroup(layout, columns);
    layout.wavelengths = addGroup(layout, stated);
    for (const std::size_t column : stated) {
        layout.statedWavelengths.push_back(firstRow[column]);
    }
}

void noteOddGroups(const Meanings& meanings, Layout& layout) {
    const struct {
        Quantity quantity;
        int size;
        const char* name;
    } groups[] = {{Quantity::Cmyk, 4, "CMYK"},
                  {Quantity::Rgb, 3, "RGB"},
                  {Quantity::Xyz, 3, "XYZ"},
                  {Quantity::Lab, 3, "Lab"}};
    for (const auto& group : groups) {
        const std::size_t found = columnsOf(meanings, group.quantity, group.size).size();
        if (found > 0 && found < static_cast<std::size_t>(group.size)) {
            layout.notes.push_back(std::string("Some ") + group.name + " columns are missing.");
        }
        if (allOf(meanings, group.quantity).size() > found && found > 0) {
            layout.notes.push_back(std::string(group.name) +
                                   " columns are repeated: the first ones are used.");
        }
    }
}

} // namespace

std::vector<ColumnMeaning> meaningsOf(const std::vector<std::string>& names) {
    Meanings meanings;
    Names plain;
    for (const std::string& name : names) {
        meanings.push_back(meaningOf(name));
        plain.push_back(normalised(name));
    }
    for (const Run& run : runs) {
        for (std::size_t i = 0; i + run.size() <= plain.size(); ++i) {
            if (!std::equal(plain.begin() + static_cast<std::ptrdiff_t>(i),
                            plain.begin() + static_cast<std::ptrdiff_t>(i + run.size()),
                            run.names.begin())) {
                continue;
            }
            for (std::size_t k = 0; k < run.size(); ++k) {
                meanings[i + k] = {run.quantity, static_cast<int>(k)};
            }
        }
    }
    // A single bare number among the names may be anything; several are a spectrum.
    const auto isBare = [&](std::size_t i) {
        return meanings[i].quantity == Quantity::Spectral && isDigit(plain[i].front()) &&
               !plain[i].ends_with("NM");
    };
    std::size_t bare = 0;
    for (std::size_t i = 0; i < plain.size(); ++i) {
        bare += isBare(i) ? 1 : 0;
    }
    for (std::size_t i = 0; i < plain.size() && bare < 4; ++i) {
        if (isBare(i)) {
            meanings[i] = {};
        }
    }
    return meanings;
}

bool isNumberedInk(std::string_view channel) {
    std::string name = normalised(channel);
    if (colorantIndex(name)) {
        return true;
    }
    const std::size_t digits = name.find_last_not_of("0123456789") + 1;
    constexpr std::size_t mostDigits = 2; // More digits are a name, such as an ink of a colour fan.
    if (digits == name.size() || name.size() - digits > mostDigits) {
        return false;
    }
    name = squeezed(name.substr(0, digits));
    return name == "SPOT" || name.starts_with("CMYK");
}

bool holdWholeGroup(const std::vector<ColumnMeaning>& meanings) {
    return columnsOf(meanings, Quantity::Cmyk, 4).size() == 4 ||
           columnsOf(meanings, Quantity::Rgb, 3).size() == 3 ||
           columnsOf(meanings, Quantity::Lab, 3).size() == 3 ||
           columnsOf(meanings, Quantity::Xyz, 3).size() == 3 ||
           allOf(meanings, Quantity::Spectral).size() >= 4 ||
           !allOf(meanings, Quantity::Colorant).empty();
}

Layout layoutOf(const std::vector<std::string>& names, const std::vector<double>& firstRow,
                bool wantSpectra) {
    Layout layout;
    layout.columns.resize(names.size());
    Meanings meanings = meaningsOf(names);
    if (!allOf(meanings, Quantity::CurveInput).empty()) {
        layout.kind = TableKind::Curve;
    } else if (!allOf(meanings, Quantity::RowIndex).empty()) {
        layout.kind = TableKind::Extremes;
    }

    if (const auto id = bestOf(meanings, Quantity::Id)) {
        layout.columns[*id].kind = Column::Id;
        layout.hasIds = true;
    }
    if (const auto name = bestOf(meanings, Quantity::Name)) {
        layout.columns[*name].kind = Column::Name;
        layout.hasNames = true;
    }
    layOutDevice(names, meanings, layout);
    if (const auto xyz = columnsOf(meanings, Quantity::Xyz, 3); xyz.size() == 3) {
        layout.xyz = addGroup(layout, xyz);
    }
    if (const auto lab = columnsOf(meanings, Quantity::Lab, 3); lab.size() == 3) {
        layout.lab = addGroup(layout, lab);
    }
    if (wantSpectra || (layout.xyz.count == 0 && layout.lab.count == 0)) {
        layOutSpectra(firstRow, meanings, layout);
    }
    noteOddGroups(meanings, layout);
    return layout;
}

} // namespace colour::cgats
