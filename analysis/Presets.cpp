// <?xml version="1.0" encoding="UTF-8"?>
// <tolerancePreset version="1">
//   <id>1</id>
//   <name>Contract proof</name>
//   <formula>CIE2000</formula>
//   <editable>no</editable>
//   <showInClient>yes</showInClient>
//   <usedForDynamicWedge>yes</usedForDynamicWedge>
//   <illuminationCondition>-1</illuminationCondition>
//   <psd>no</psd>
//   <criteria>
//     <average tolerance="2.5" used="yes" decimals="1"/>
//     <paperWhite tolerance="3" used="yes" decimals="1" psdTolerance="3" psdUsed="no"/>
//   </criteria>
// </tolerancePreset>
//
// Everything outside criteria must be there once, in any order; within criteria each name of
// analysis/Criteria.h may be there once. What is not known is refused rather than passed over: it
// is most likely a slip of the pen in something that was meant to count.
#include "analysis/Presets.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <iterator>
#include <system_error>
#include <utility>

#include <pugixml.hpp>

#include "ExitCodes.h"
#include "analysis/Criteria.h"
#include "analysis/Text.h"
#include "colour/ColourFile.h"
#include "colour/Difference.h"

namespace analysis {
namespace {

constexpr int formatVersion = 1;
constexpr double largestTolerance = 1000;
constexpr int largestDecimals = 10;
constexpr int largestCondition = 999;
constexpr int largestId = 2147483647;

using Status = int; // of ExitCodes.h; exitDone goes on

/// A number with a decimal point, whatever the locale, within its range.
template<class Number>
Status readNumber(std::string_view text, Number smallest, Number largest, Number& number) {
    text = trimmed(text);
    if (text.empty())
        return exitPresetValueMissing;
    const std::string_view digits = "0123456789";
    if (text.find_first_of(digits) == std::string_view::npos) // such as "inf" and "nan"
        return exitPresetNotNumeric;
    Number value{};
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (error == std::errc::invalid_argument || end != text.data() + text.size())
        return exitPresetNotNumeric;
    if (error != std::errc{} || !(value >= smallest && value <= largest))
        return exitPresetOutOfRange;
    number = value;
    return exitDone;
}

Status readSwitch(std::string_view text, int& value) {
    text = trimmed(text);
    if (text.empty())
        return exitPresetValueMissing;
    if (text != "yes" && text != "no")
        return exitPresetOutOfRange;
    value = text == "yes" ? 1 : 0;
    return exitDone;
}

Status readFormula(std::string_view text, int& number) {
    using colour::Formula;
    text = trimmed(text);
    if (text.empty())
        return exitPresetValueMissing;
    for (const Formula formula :
         {Formula::Cie76, Formula::Cmc11, Formula::Cie94, Formula::Ciede2000, Formula::Cmc21}) {
        if (text == colour::formulaName(formula)) {
            number = static_cast<int>(formula);
            return exitDone;
        }
    }
    return exitPresetOutOfRange;
}

Status readName(std::string_view text, wxString& name) {
    const std::wstring wide = widened(trimmed(text));
    if (wide.empty())
        return exitPresetValueMissing;
    const auto isStrayByte = [](wchar_t unit) { return unit >= 0xDC80 && unit <= 0xDCFF; };
    if (std::any_of(wide.begin(), wide.end(), isStrayByte))
        return exitPresetNotXml;
    name = wxString(wide);
    return exitDone;
}

using Record = tolerancePresetParameterRecord;

/// The elements beside criteria, each with what its text becomes.
constexpr struct Field {
    const char* name;
    Status (*read)(std::string_view text, Record& preset);
} fields[] = {
    {"id",
     [](auto text, Record& preset) { return readNumber(text, 0, largestId, preset.presetID); }},
    {"name", [](auto text, Record& preset) { return readName(text, preset.name); }},
    {"formula", [](auto text, Record& preset) { return readFormula(text, preset.deltaEMode); }},
    {"editable", [](auto text, Record& preset) { return readSwitch(text, preset.editable); }},
    {"showInClient",
     [](auto text, Record& preset) { return readSwitch(text, preset.showInClient); }},
    {"usedForDynamicWedge",
     [](auto text, Record& preset) { return readSwitch(text, preset.usedForDynamicWedge); }},
    {"illuminationCondition",
     [](auto text, Record& preset) {
         return readNumber(text, -1, largestCondition, preset.illuminationCondition);
     }},
    {"psd", [](auto text, Record& preset) { return readSwitch(text, preset.fograPSDPreset); }},
};

/// The text of an element that holds nothing else.
Status textOf(const pugi::xml_node& element, std::string& text) {
    if (element.first_attribute())
        return exitPresetUnknownEntry;
    for (const pugi::xml_node& part : element) {
        if (part.type() == pugi::node_element)
            return exitPresetUnknownEntry;
        text += part.value();
    }
    return exitDone;
}

/// The attributes of an element by the names that it may have; null where one is absent.
template<std::size_t count>
Status attributesOf(const pugi::xml_node& element, const char* const (&names)[count],
                    std::array<const char*, count>& values) {
    values.fill(nullptr);
    for (const pugi::xml_attribute& attribute : element.attributes()) {
        const auto* name =
            std::find(std::begin(names), std::end(names), std::string_view(attribute.name()));
        if (name == std::end(names))
            return exitPresetUnknownEntry;
        const char*& value = values[name - std::begin(names)];
        if (value)
            return exitPresetValueRepeated;
        value = attribute.value();
    }
    return exitDone;
}

Status readCriterion(const pugi::xml_node& element, const Criterion& criterion, Record& preset) {
    constexpr const char* names[] = {"tolerance", "used", "decimals", "psdTolerance", "psdUsed"};
    std::array<const char*, std::size(names)> values{};
    Status status = attributesOf(element, names, values);
    if (status == exitDone && element.first_child())
        status = exitPresetUnknownEntry;
    const auto [tolerance, used, decimals, psdTolerance, psdUsed] = values;
    const bool hasPsd = psdTolerance || psdUsed || preset.fograPSDPreset > 0;

    const auto tolerances = [&](const char* text, double& value) {
        if (status == exitDone)
            status = readNumber(text ? text : "", 0.0, largestTolerance, value);
    };
    const auto switches = [&](const char* text, int& value) {
        if (status == exitDone)
            status = readSwitch(text ? text : "", value);
    };
    tolerances(tolerance, preset.presetValues[criterion.index]);
    switches(used, preset.usedForResult[criterion.index]);
    if (status == exitDone)
        status = readNumber(decimals ? decimals : "", 0, largestDecimals,
                            preset.decimalPlaces[criterion.index]);
    if (hasPsd) {
        tolerances(psdTolerance, preset.psdPresetValues[criterion.psdEntry]);
        switches(psdUsed, preset.usedForPSDResult[criterion.psdEntry]);
    }
    return status;
}

/// REQUIRES: preset.fograPSDPreset is read: a PSD preset must state its values for each criterion.
Status readCriteria(const pugi::xml_node& section, Record& preset) {
    if (section.first_attribute())
        return exitPresetUnknownEntry;
    std::array<bool, presetValueCount> seen{};
    for (const pugi::xml_node& element : section) {
        const Criterion* criterion =
            element.type() == pugi::node_element ? criterionOfName(element.name()) : nullptr;
        if (!criterion)
            return exitPresetUnknownEntry;
        if (std::exchange(seen[criterion->index], true))
            return exitPresetValueRepeated;
        if (const Status status = readCriterion(element, *criterion, preset); status != exitDone)
            return status;
    }
    return exitDone;
}

Status readVersion(const pugi::xml_node& root) {
    constexpr const char* names[] = {"version"};
    std::array<const char*, 1> values{};
    if (const Status status = attributesOf(root, names, values); status != exitDone)
        return status;
    int version = 0;
    return readNumber(values[0] ? values[0] : "", formatVersion, formatVersion, version);
}

Status readRoot(const pugi::xml_node& root, Record& preset) {
    if (const Status status = readVersion(root); status != exitDone)
        return status;
    pugi::xml_node criteriaSection;
    std::array<pugi::xml_node, std::size(fields)> found;
    for (const pugi::xml_node& element : root) {
        const std::string_view name = element.name(); // empty for stray text
        const auto* field = std::find_if(std::begin(fields), std::end(fields),
                                         [&](const Field& f) { return name == f.name; });
        if (field == std::end(fields) && name != "criteria")
            return exitPresetUnknownEntry;
        pugi::xml_node& place =
            field == std::end(fields) ? criteriaSection : found[field - std::begin(fields)];
        if (place)
            return exitPresetValueRepeated;
        place = element;
    }
    for (std::size_t i = 0; i < std::size(fields); ++i) {
        if (!found[i])
            return exitPresetValueMissing;
        std::string text;
        Status status = textOf(found[i], text);
        if (status == exitDone)
            status = fields[i].read(text, preset);
        if (status != exitDone)
            return status;
    }
    return criteriaSection ? readCriteria(criteriaSection, preset) : exitPresetValueMissing;
}

/// The one element of a document. A document type can only bring entities, which no preset needs.
Status rootOf(const pugi::xml_document& document, pugi::xml_node& root) {
    for (const pugi::xml_node& part : document) {
        if (part.type() == pugi::node_doctype)
            return exitPresetWrongKind;
        if (part.type() != pugi::node_element || root)
            return exitPresetNotXml;
        root = part;
    }
    if (!root)
        return exitPresetNotXml;
    return root.name() == std::string_view("tolerancePreset") ? exitDone : exitPresetWrongKind;
}

} // namespace

int parsePreset(std::string_view bytes, bool keepJobChoice,
                tolerancePresetParameterRecord& preset) {
    if (bytes.size() > maxPresetBytes)
        return exitPresetWrongKind;
    if (bytes.find('\0') != std::string_view::npos) // would end the document for pugixml
        return exitPresetNotXml;
    pugi::xml_document document;
    const auto parsed =
        document.load_buffer(bytes.data(), bytes.size(),
                             pugi::parse_default | pugi::parse_fragment | pugi::parse_doctype);
    if (parsed.status == pugi::status_out_of_memory)
        return exitOutOfMemory;
    if (!parsed)
        return exitPresetNotXml;

    tolerancePresetParameterRecord read;
    pugi::xml_node root;
    Status status = rootOf(document, root);
    if (status == exitDone)
        status = readRoot(root, read);
    if (status != exitDone)
        return status;
    read.filePath = preset.filePath;
    read.reserved1 = preset.reserved1;
    read.reserved2 = preset.reserved2;
    if (keepJobChoice) {
        read.presetID = preset.presetID;
        read.deltaEMode = preset.deltaEMode;
    }
    preset = read;
    return exitDone;
}

int readPreset(const std::string& path, bool keepJobChoice,
               tolerancePresetParameterRecord& preset) {
    std::string bytes;
    switch (colour::readWholeFile(path, maxPresetBytes, bytes)) {
    case colour::Failure::None:
        break;
    case colour::Failure::Missing:
        return exitPresetMissing;
    case colour::Failure::TooLarge:
        return exitPresetWrongKind;
    case colour::Failure::OutOfMemory:
        return exitOutOfMemory;
    default:
        return exitPresetUnreadable;
    }
    const int status = parsePreset(bytes, keepJobChoice, preset);
    if (status == exitDone && preset.filePath.empty())
        preset.filePath = wxString(widened(path));
    return status;
}

} // namespace analysis
