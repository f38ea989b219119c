// SPDX-License-Identifier: Apache-2.0
// <?xml version="1.0" encoding="UTF-8"?>
// <tolerancePreset version="1">
//   <id>1</id>
//   <name>Contract proof</name>
//   <formula>CIE2000</formula>
//   <editable>no</editable>
//   <showInClient>yes</showInClient>
//   <usedForDynamicWedge>yes</usedForDynamicWedge>
//   <illuminationCondition required="yes">1</illuminationCondition>     or without required: no
//   <psd>no</psd>
//   <repeats>mean</repeats>               may be absent: each
//   <minimumGreys>5</minimumGreys>        may be absent: 5
//   <inks>Orange, Green, Violet</inks>    may be absent; the inks after C, M, Y, K
//   <paper>absolute</paper>               may be absent: absolute; or corrected, relative
//   <toneAims>target</toneAims>           may be absent: target; or A, B, C
//   <toneAimsBlack>B</toneAimsBlack>      may be absent: as toneAims
//   <spotToneAims>nominal</spotToneAims>  may be absent: nominal; or target
//   <greyWeights>equal</greyWeights>      may be absent: equal; or falling
//   <criteria>
//     <average tolerance="2.5" used="yes" decimals="1"/>
//     <paperWhite tolerance="3" used="yes" decimals="1" psdTolerance="3" psdUsed="no"/>
//   </criteria>
// </tolerancePreset>
//
// Everything else outside criteria must be there once, in any order; within criteria each name of
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
#include "base/Trim.h"
#include "base/Utf8.h"
#include "base/WideBytes.h"
#include "colour/ColourFile.h"
#include "colour/Difference.h"

namespace analysis {
namespace {

constexpr int formatVersion = 1;
constexpr double largestTolerance = 1000;
constexpr int largestDecimals = 10;
constexpr int largestCondition = 999;
constexpr int mostGreys = 1000;
constexpr int largestId = 2147483647;
constexpr std::size_t mostInks = 60;
constexpr std::size_t longestInk = 100; // bytes

using Status = int; // of ExitCodes.h; exitDone goes on

/// A number with a decimal point, whatever the locale, within its range.
template<class Number>
Status readNumber(std::string_view text, Number smallest, Number largest, Number& number) {
    text = base::trimmed(text);
    if (text.empty()) {
        return exitPresetValueMissing;
    }
    const std::string_view digits = "0123456789";
    if (text.find_first_of(digits) == std::string_view::npos) { // such as "inf" and "nan"
        return exitPresetNotNumeric;
    }
    Number value{};
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (error == std::errc::invalid_argument || end != text.data() + text.size()) {
        return exitPresetNotNumeric;
    }
    if (error != std::errc{} || !(value >= smallest && value <= largest)) {
        return exitPresetOutOfRange;
    }
    number = value;
    return exitDone;
}

Status readSwitch(std::string_view text, int& value) {
    text = base::trimmed(text);
    if (text.empty()) {
        return exitPresetValueMissing;
    }
    if (text != "yes" && text != "no") {
        return exitPresetOutOfRange;
    }
    value = text == "yes" ? 1 : 0;
    return exitDone;
}

Status readFormula(std::string_view text, int& number) {
    using colour::Formula;
    text = base::trimmed(text);
    if (text.empty()) {
        return exitPresetValueMissing;
    }
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
    text = base::trimmed(text);
    if (text.empty()) {
        return exitPresetValueMissing;
    }
    if (!base::isUtf8(text)) {
        return exitPresetNotXml;
    }
    name = wxString(base::wideFromBytes(text));
    return exitDone;
}

/// Equal but for the case of ASCII letters.
bool sameWord(std::string_view left, std::string_view right) {
    const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c | 32) : c; };
    return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                      [&](char a, char b) { return lower(a) == lower(b); });
}

/// Names separated by commas. C, M, Y and K are not among them: a list that begins with these
/// would name every further ink wrong.
Status readInks(std::string_view text, std::vector<std::string>& inks) {
    std::vector<std::string> names;
    for (bool more = true; more;) {
        const std::size_t comma = text.find(',');
        const std::string_view name = base::trimmed(text.substr(0, comma));
        more = comma != text.npos;
        text.remove_prefix(more ? comma + 1 : 0);
        if (name.empty()) {
            return exitPresetValueMissing;
        }
        if (!base::isUtf8(name)) {
            return exitPresetNotXml;
        }
        const auto isControl = [](char c) { return static_cast<unsigned char>(c) < ' '; };
        if (names.size() == mostInks || name.size() > longestInk ||
            std::any_of(name.begin(), name.end(), isControl)) {
            return exitPresetOutOfRange;
        }
        for (const char* process : {"Cyan", "Magenta", "Yellow", "Black"}) {
            if (sameWord(name, process)) {
                return exitPresetOutOfRange;
            }
        }
        for (const char* letter : {"C", "M", "Y", "K"}) { // small letters are those of light inks
            if (name == letter) {
                return exitPresetOutOfRange;
            }
        }
        for (const std::string& other : names) {
            if (sameWord(name, other)) {
                return exitPresetValueRepeated;
            }
        }
        names.emplace_back(name);
    }
    inks = std::move(names);
    return exitDone;
}

/// One of a few words.
template<class Choice, std::size_t count>
Status readChoice(std::string_view text, const char* (*nameOf)(Choice),
                  const Choice (&choices)[count], Choice& choice) {
    text = base::trimmed(text);
    if (text.empty()) {
        return exitPresetValueMissing;
    }
    for (const Choice each : choices) {
        if (text == nameOf(each)) {
            choice = each;
            return exitDone;
        }
    }
    return exitPresetOutOfRange;
}

constexpr RepeatMode repeatModes[] = {RepeatMode::Each, RepeatMode::Mean};
constexpr PaperAims paperAims[] = {PaperAims::Absolute, PaperAims::Corrected, PaperAims::Relative};
constexpr ToneAims toneAims[] = {ToneAims::Target, ToneAims::CurveA, ToneAims::CurveB,
                                 ToneAims::CurveC};
constexpr GreyWeights greyWeights[] = {GreyWeights::Equal, GreyWeights::Falling};
constexpr bool spotToneAims[] = {false, true};

const char* spotToneAimsName(bool fromTarget) {
    return fromTarget ? "target" : "nominal";
}

using Record = tolerancePresetParameterRecord;

/// All that a file states.
struct Preset : Record {
    PresetOptions options;
};

/// The elements beside criteria, each with what its text becomes.
constexpr struct Field {
    const char* name;
    Status (*read)(std::string_view text, Preset& preset);
    bool optional = false;
} fields[] = {
    {"id",
     [](auto text, Preset& preset) { return readNumber(text, 0, largestId, preset.presetID); }},
    {"name", [](auto text, Preset& preset) { return readName(text, preset.name); }},
    {"formula", [](auto text, Preset& preset) { return readFormula(text, preset.deltaEMode); }},
    {"editable", [](auto text, Preset& preset) { return readSwitch(text, preset.editable); }},
    {"showInClient",
     [](auto text, Preset& preset) { return readSwitch(text, preset.showInClient); }},
    {"usedForDynamicWedge",
     [](auto text, Preset& preset) { return readSwitch(text, preset.usedForDynamicWedge); }},
    {"illuminationCondition",
     [](auto text, Preset& preset) {
         return readNumber(text, -1, largestCondition, preset.illuminationCondition);
     }},
    {"psd", [](auto text, Preset& preset) { return readSwitch(text, preset.fograPSDPreset); }},
    {"repeats",
     [](auto text, Preset& preset) {
         return readChoice(text, repeatModeName, repeatModes, preset.options.repeats);
     },
     true},
    {"minimumGreys",
     [](auto text, Preset& preset) {
         return readNumber(text, 1, mostGreys, preset.options.minimumGreys);
     },
     true},
    {"inks", [](auto text, Preset& preset) { return readInks(text, preset.options.inks); }, true},
    {"paper",
     [](auto text, Preset& preset) {
         return readChoice(text, paperAimsName, paperAims, preset.options.paperAims);
     },
     true},
    {"toneAims",
     [](auto text, Preset& preset) {
         return readChoice(text, toneAimsName, toneAims, preset.options.toneAims);
     },
     true},
    {"toneAimsBlack",
     [](auto text, Preset& preset) {
         return readChoice(text, toneAimsName, toneAims, preset.options.toneAimsBlack.emplace());
     },
     true},
    {"spotToneAims",
     [](auto text, Preset& preset) {
         return readChoice(text, spotToneAimsName, spotToneAims, preset.options.spotToneFromTarget);
     },
     true},
    {"greyWeights",
     [](auto text, Preset& preset) {
         return readChoice(text, greyWeightsName, greyWeights, preset.options.greyWeights);
     },
     true},
};

/// The fault that reading meets, with its place.
class Finding {
  public:
    /// An element, or what is wrong within its parent.
    Status at(Status status, const pugi::xml_node& node, std::string_view text = {}) {
        return status == exitDone ? status : note(status, node, nameOf(node), text);
    }
    Status atAttribute(Status status, const pugi::xml_node& element, const std::string& attribute,
                       std::string_view text = {}) {
        return status == exitDone
                   ? status
                   : note(status, element, attribute + " of " + nameOf(element), text);
    }
    Status missing(const pugi::xml_node& parent, const std::string& name) {
        return note(exitPresetValueMissing, parent, "<" + name + ">", {});
    }
    Status document(Status status, std::ptrdiff_t offset, std::string description) {
        m_offset = offset;
        m_description = std::move(description);
        return status;
    }

    /// -1 without a place.
    std::ptrdiff_t offset() const { return m_offset; }
    const std::string& description() const { return m_description; }

  private:
    static std::string nameOf(const pugi::xml_node& node) {
        return node.type() == pugi::node_element ? "<" + std::string(node.name()) + ">"
                                                 : "text in " + nameOf(node.parent());
    }

    Status note(Status status, const pugi::xml_node& node, const std::string& place,
                std::string_view text) {
        constexpr std::size_t longest = 60; // A long text would hide what is said about it.
        const std::string_view value = node.value(); // Text begins at the end of the line before.
        const std::size_t blanks = std::min(value.find_first_not_of(" \t\r\n"), value.size());
        m_offset = node.offset_debug() + static_cast<std::ptrdiff_t>(blanks);
        m_description = place;
        for (const auto& [code, what] : {
                 std::pair{exitPresetNotXml, " is not UTF-8"},
                 std::pair{exitPresetValueMissing, " is missing or empty"},
                 std::pair{exitPresetValueRepeated, " appears twice"},
                 std::pair{exitPresetNotNumeric, " is not a number"},
                 std::pair{exitPresetOutOfRange, " is outside its range or not one of its choices"},
                 std::pair{exitPresetUnknownEntry, " is unknown here"},
             }) {
            if (code == status) {
                m_description += what;
            }
        }
        if (!text.empty() && status != exitPresetNotXml) {
            m_description += ": " + std::string(text.substr(0, longest));
        }
        return status;
    }

    std::ptrdiff_t m_offset = -1;
    std::string m_description;
};

/// The text of an element without child elements.
Status textOf(const pugi::xml_node& element, std::string& text, Finding& finding) {
    for (const pugi::xml_node& part : element) {
        if (part.type() == pugi::node_element) {
            return finding.at(exitPresetUnknownEntry, part);
        }
        text += part.value();
    }
    return exitDone;
}

/// The attributes of an element by the names that it may have; null where one is absent.
template<std::size_t count>
Status attributesOf(const pugi::xml_node& element, const char* const (&names)[count],
                    std::array<const char*, count>& values, Finding& finding) {
    values.fill(nullptr);
    for (const pugi::xml_attribute& attribute : element.attributes()) {
        const auto* name =
            std::find(std::begin(names), std::end(names), std::string_view(attribute.name()));
        if (name == std::end(names)) {
            return finding.atAttribute(exitPresetUnknownEntry, element, attribute.name());
        }
        const char*& value = values[name - std::begin(names)];
        if (value) {
            return finding.atAttribute(exitPresetValueRepeated, element, *name);
        }
        value = attribute.value();
    }
    return exitDone;
}

/// Reads the attributes of an element beside criteria: only the condition may have one.
Status readAttributes(const pugi::xml_node& element, Preset& preset, Finding& finding) {
    if (element.name() != std::string_view("illuminationCondition")) {
        const pugi::xml_attribute attribute = element.first_attribute();
        return attribute ? finding.atAttribute(exitPresetUnknownEntry, element, attribute.name())
                         : exitDone;
    }
    constexpr const char* names[] = {"required"};
    std::array<const char*, 1> values{};
    const Status status = attributesOf(element, names, values, finding);
    if (status != exitDone || !values[0]) {
        return status;
    }
    int required = 0;
    if (const Status read = readSwitch(values[0], required); read != exitDone) {
        return finding.atAttribute(read, element, names[0], values[0]);
    }
    preset.options.conditionRequired = required != 0;
    return exitDone;
}

/// Where the settings of a criterion go: into the record, or beside it.
struct Places {
    double& tolerance;
    int& used;
    int& decimals;
    double& psdTolerance;
    int& psdUsed;
};

Status readSettings(const pugi::xml_node& element, bool isPsd, Places places, Finding& finding) {
    constexpr const char* names[] = {"tolerance", "used", "decimals", "psdTolerance", "psdUsed"};
    std::array<const char*, std::size(names)> values{};
    if (const Status status = attributesOf(element, names, values, finding); status != exitDone) {
        return status;
    }
    if (const pugi::xml_node part = element.first_child()) {
        return finding.at(exitPresetUnknownEntry, part);
    }
    const bool hasPsd = values[3] || values[4] || isPsd;
    for (std::size_t i = 0; i < (hasPsd ? std::size(names) : 3); ++i) {
        const char* const text = values[i] ? values[i] : "";
        Status status = exitDone;
        switch (i) {
        case 0:
            status = readNumber(text, 0.0, largestTolerance, places.tolerance);
            break;
        case 1:
            status = readSwitch(text, places.used);
            break;
        case 2:
            status = readNumber(text, 0, largestDecimals, places.decimals);
            break;
        case 3:
            status = readNumber(text, 0.0, largestTolerance, places.psdTolerance);
            break;
        default:
            status = readSwitch(text, places.psdUsed);
        }
        if (status != exitDone) {
            return finding.atAttribute(status, element, names[i], text);
        }
    }
    return exitDone;
}

Status readCriterion(const pugi::xml_node& element, const Criterion& criterion, Preset& preset,
                     Finding& finding) {
    const bool isPsd = preset.fograPSDPreset > 0;
    if (criterion.index != noEntry) {
        return readSettings(
            element, isPsd,
            {preset.presetValues[criterion.index], preset.usedForResult[criterion.index],
             preset.decimalPlaces[criterion.index], preset.psdPresetValues[criterion.psdEntry],
             preset.usedForPSDResult[criterion.psdEntry]},
            finding);
    }
    double tolerance = 0, psdTolerance = 0;
    int used = 0, psdUsed = 0, decimals = 0;
    const Status status =
        readSettings(element, isPsd, {tolerance, used, decimals, psdTolerance, psdUsed}, finding);
    preset.options.named[placeOf(criterion)] = isPsd ? Setting{psdTolerance, psdUsed != 0, decimals}
                                                     : Setting{tolerance, used != 0, decimals};
    return status;
}

/// REQUIRES: preset.fograPSDPreset is read: a PSD preset must state its values for each criterion.
Status readCriteria(const pugi::xml_node& section, Preset& preset, Finding& finding) {
    if (const pugi::xml_attribute attribute = section.first_attribute()) {
        return finding.atAttribute(exitPresetUnknownEntry, section, attribute.name());
    }
    std::array<bool, criterionCount> seen{};
    for (const pugi::xml_node& element : section) {
        const Criterion* criterion =
            element.type() == pugi::node_element ? criterionOfName(element.name()) : nullptr;
        if (!criterion) {
            return finding.at(exitPresetUnknownEntry, element);
        }
        if (std::exchange(seen[placeOf(*criterion)], true)) {
            return finding.at(exitPresetValueRepeated, element);
        }
        preset.options.stated.set(placeOf(*criterion));
        if (const Status status = readCriterion(element, *criterion, preset, finding);
            status != exitDone) {
            return status;
        }
    }
    return exitDone;
}

Status readVersion(const pugi::xml_node& root, Finding& finding) {
    constexpr const char* names[] = {"version"};
    std::array<const char*, 1> values{};
    if (const Status status = attributesOf(root, names, values, finding); status != exitDone) {
        return status;
    }
    int version = 0;
    const char* const text = values[0] ? values[0] : "";
    return finding.atAttribute(readNumber(text, formatVersion, formatVersion, version), root,
                               names[0], text);
}

Status readRoot(const pugi::xml_node& root, Preset& preset, Finding& finding) {
    if (const Status status = readVersion(root, finding); status != exitDone) {
        return status;
    }
    pugi::xml_node criteriaSection;
    std::array<pugi::xml_node, std::size(fields)> found;
    for (const pugi::xml_node& element : root) {
        const std::string_view name = element.name(); // empty for stray text
        const auto* field = std::find_if(std::begin(fields), std::end(fields),
                                         [&](const Field& f) { return name == f.name; });
        if (field == std::end(fields) && name != "criteria") {
            return finding.at(exitPresetUnknownEntry, element);
        }
        pugi::xml_node& place =
            field == std::end(fields) ? criteriaSection : found[field - std::begin(fields)];
        if (place) {
            return finding.at(exitPresetValueRepeated, element);
        }
        place = element;
    }
    for (std::size_t i = 0; i < std::size(fields); ++i) {
        if (!found[i] && fields[i].optional) {
            continue;
        }
        if (!found[i]) {
            return finding.missing(root, fields[i].name);
        }
        std::string text;
        Status status = readAttributes(found[i], preset, finding);
        if (status == exitDone) {
            status = textOf(found[i], text, finding);
        }
        if (status == exitDone) {
            status = finding.at(fields[i].read(text, preset), found[i], base::trimmed(text));
        }
        if (status != exitDone) {
            return status;
        }
        const bool isUnmeetable = preset.options.conditionRequired &&
                                  preset.illuminationCondition > largestMeasuringCondition;
        if (isUnmeetable) {
            return finding.at(exitPresetOutOfRange, found[i], base::trimmed(text));
        }
    }
    return criteriaSection ? readCriteria(criteriaSection, preset, finding)
                           : finding.missing(root, "criteria");
}

/// The one element of a document. A document type can only bring entities, which no preset needs.
Status rootOf(const pugi::xml_document& document, pugi::xml_node& root, Finding& finding) {
    for (const pugi::xml_node& part : document) {
        if (part.type() == pugi::node_doctype) {
            return finding.document(exitPresetWrongKind, part.offset_debug(),
                                    "a preset has no document type");
        }
        if (part.type() != pugi::node_element || root) {
            return finding.document(exitPresetNotXml, part.offset_debug(),
                                    "a document is one element");
        }
        root = part;
    }
    if (!root) {
        return finding.document(exitPresetNotXml, -1, "there is no element");
    }
    if (root.name() != std::string_view("tolerancePreset")) {
        return finding.document(exitPresetWrongKind, root.offset_debug(),
                                "the outermost element is not <tolerancePreset>");
    }
    return exitDone;
}

/// Line of a place that is counted in bytes of UTF-8, to which the parser converts Latin-1.
std::size_t lineOf(std::string_view bytes, std::ptrdiff_t offset, bool isLatin1) {
    std::size_t line = 1;
    std::ptrdiff_t at = 0;
    for (const char c : bytes) {
        if (at >= offset) {
            break;
        }
        at += isLatin1 && (c & 0x80) != 0 ? 2 : 1;
        line += c == '\n' ? 1 : 0;
    }
    return line;
}

Status parse(std::string_view bytes, Preset& preset, pugi::xml_document& document,
             pugi::xml_encoding& encoding, Finding& finding) {
    if (bytes.size() > maxPresetBytes) {
        return finding.document(exitPresetWrongKind, -1, "the file has more than 1 MB");
    }
    if (const std::size_t nul = bytes.find('\0'); nul != bytes.npos) { // ends pugixml's document
        return finding.document(exitPresetNotXml, static_cast<std::ptrdiff_t>(nul),
                                "the file has a byte 0 in it");
    }
    const auto parsed =
        document.load_buffer(bytes.data(), bytes.size(),
                             pugi::parse_default | pugi::parse_fragment | pugi::parse_doctype);
    encoding = parsed.encoding;
    if (parsed.status == pugi::status_out_of_memory) {
        return exitOutOfMemory;
    }
    if (!parsed) {
        return finding.document(exitPresetNotXml, parsed.offset, parsed.description());
    }
    pugi::xml_node root;
    const Status status = rootOf(document, root, finding);
    return status == exitDone ? readRoot(root, preset, finding) : status;
}

/// Parses, and describes a fault.
Status parse(std::string_view bytes, Preset& preset, PresetFault* fault) {
    pugi::xml_document document;
    pugi::xml_encoding encoding = pugi::encoding_utf8;
    Finding finding;
    const Status status = parse(bytes, preset, document, encoding, finding);
    if (status != exitDone && fault) {
        const bool hasPlace = finding.offset() >= 0;
        fault->line =
            hasPlace ? lineOf(bytes, finding.offset(), encoding == pugi::encoding_latin1) : 0;
        fault->description = finding.description();
    }
    return status;
}

/// The same from a file.
Status parseFile(const std::string& path, Preset& preset, PresetFault* fault) {
    std::string bytes;
    const auto fail = [&](int status, const char* description) {
        if (fault) {
            *fault = {0, description};
        }
        return status;
    };
    switch (colour::readWholeFile(path, maxPresetBytes, bytes)) {
    case colour::Failure::None:
        return parse(bytes, preset, fault);
    case colour::Failure::Missing:
        return fail(exitPresetMissing, "there is no file");
    case colour::Failure::TooLarge:
        return fail(exitPresetWrongKind, "the file has more than 1 MB");
    case colour::Failure::OutOfMemory:
        return exitOutOfMemory;
    default:
        return fail(exitPresetUnreadable, "the file can't be read");
    }
}

/// What the last preset that was read states beyond its record, under the record's filePath. A
/// preset may come through a pipe, which can be read only once.
struct LastRead {
    std::string path;
    PresetOptions options;
};

LastRead& lastRead() {
    static LastRead last;
    return last;
}

/// Takes over what a file states, but for what a job chooses itself.
void take(const Preset& read, bool keepJobChoice, Record& preset) {
    Record taken = static_cast<const Record&>(read);
    taken.filePath = preset.filePath;
    taken.reserved1 = preset.reserved1;
    taken.reserved2 = preset.reserved2;
    if (keepJobChoice) {
        taken.presetID = preset.presetID;
        taken.deltaEMode = preset.deltaEMode;
    }
    preset = taken;
}

} // namespace

const char* toneAimsName(ToneAims aims) {
    switch (aims) {
    case ToneAims::CurveA:
        return "A";
    case ToneAims::CurveB:
        return "B";
    case ToneAims::CurveC:
        return "C";
    case ToneAims::Target:
        break;
    }
    return "target";
}

const char* greyWeightsName(GreyWeights weights) {
    return weights == GreyWeights::Falling ? "falling" : "equal";
}

bool PresetOptions::asks(Quantity quantity) const {
    return std::any_of(std::begin(criteria), std::end(criteria), [&](const Criterion& criterion) {
        return criterion.onRequest && criterion.quantity == quantity && stated[placeOf(criterion)];
    });
}

bool PresetOptions::asksTargetSpectra() const {
    return asks(Quantity::Tone) &&
           (toneAims == ToneAims::Target || toneAimsBlack == ToneAims::Target);
}

bool PresetOptions::asksMeasures() const {
    return paperAims != PaperAims::Absolute ||
           std::any_of(std::begin(criteria), std::end(criteria), [&](const Criterion& criterion) {
               return criterion.onRequest && stated[placeOf(criterion)];
           });
}

int parsePreset(std::string_view bytes, bool keepJobChoice, tolerancePresetParameterRecord& preset,
                PresetFault* fault) {
    Preset read;
    const Status status = parse(bytes, read, fault);
    if (status == exitDone) {
        take(read, keepJobChoice, preset);
    }
    return status;
}

int readPreset(const std::string& path, bool keepJobChoice, tolerancePresetParameterRecord& preset,
               PresetFault* fault) {
    Preset read;
    if (const Status status = parseFile(path, read, fault); status != exitDone) {
        return status;
    }
    take(read, keepJobChoice, preset);
    if (preset.filePath.empty()) {
        preset.filePath = wxString(base::wideFromBytes(path));
    }
    lastRead() = {base::bytesFromWide(preset.filePath.ToStdWstring()), read.options};
    return exitDone;
}

int readPresetOptions(const tolerancePresetParameterRecord& preset, PresetOptions& options) {
    const std::string path = base::bytesFromWide(preset.filePath.ToStdWstring());
    if (path.empty() || path == lastRead().path) {
        options = path.empty() ? PresetOptions() : lastRead().options;
        return exitDone;
    }
    Preset read;
    const Status status = parseFile(path, read, nullptr);
    if (status == exitDone) {
        options = read.options;
    }
    return status;
}

std::string conditionOf(const tolerancePresetParameterRecord& preset) {
    const int number = preset.illuminationCondition;
    return number >= 0 && number <= largestMeasuringCondition ? "M" + std::to_string(number) : "";
}

ComparisonWants wantsOf(const tolerancePresetParameterRecord& preset,
                        const PresetOptions& options) {
    return {.formula = colour::formulaFromNumber(preset.deltaEMode),
            .repeats = options.repeats,
            .spectra = options.asks(Quantity::Tone),
            .targetSpectra = options.asksTargetSpectra(),
            .singleInks = true,
            .readings = options.asksMeasures(),
            .paperAims = options.paperAims};
}

Setting settingOf(const Criterion& criterion, const tolerancePresetParameterRecord& preset,
                  const PresetOptions& options) {
    if (criterion.index == noEntry) {
        return options.named[placeOf(criterion)];
    }
    const int decimals = preset.decimalPlaces[criterion.index];
    if (preset.fograPSDPreset > 0) {
        return {preset.psdPresetValues[criterion.psdEntry],
                preset.usedForPSDResult[criterion.psdEntry] != 0, decimals};
    }
    return {preset.presetValues[criterion.index], preset.usedForResult[criterion.index] != 0,
            decimals};
}

} // namespace analysis
