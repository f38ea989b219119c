// A CxF3 file, as far as it is read:
//
//     <cc:CxF xmlns:cc="http://colorexchangeformat.com/CxF3-core">
//       <cc:FileInformation><cc:Creator>...</cc:Creator>...</cc:FileInformation>
//       <cc:Resources>
//         <cc:ObjectCollection>
//           <cc:Object ObjectType="Target" Name="1" Id="t1">
//             <cc:DeviceColorValues>
//               <cc:ColorCMYKPlusN ColorSpecification="inks">
//                 <cc:Cyan>0</cc:Cyan>...
//                 <cc:SpotColor><cc:Name>Orange</cc:Name><cc:Percentage>50</cc:Percentage>...
//           <cc:Object ObjectType="M1_Measurement" Name="m1" Id="c1">
//             <cc:ColorValues>
//               <cc:ReflectanceSpectrum StartWL="380" ColorSpecification="s">0.81 0.83 ...
//               <cc:ColorCIELab ColorSpecification="s"><cc:L>95</cc:L><cc:A>0</cc:A>...
//             <cc:TagCollection Name="Location"><cc:Tag Name="Row" Value="1"/>...
//         <cc:ColorSpecificationCollection>
//           <cc:ColorSpecification Id="s">
//             <cc:TristimulusSpec><cc:Illuminant>D50</cc:Illuminant>...
//             <cc:MeasurementSpec><cc:WavelengthRange StartWL="380" Increment="10"/>
//               <cc:Device>...<cc:DeviceIllumination>M1_Daylight</cc:DeviceIllumination>
//
// CxfXml.h parses, CxfObjects.h tells what there is; this file makes patches of it.
#include "colour/Cxf.h"

#include <algorithm>
#include <cmath>
#include <new>
#include <numbers>
#include <set>
#include <stdexcept>
#include <string>
#include <unordered_map>
#include <vector>

#include "colour/CgatsLines.h"
#include "colour/CgatsTables.h"
#include "colour/CxfObjects.h"
#include "colour/Spectra.h"
#include "colour/TextEncoding.h"

namespace colour {
namespace {

using namespace cxf;

constexpr std::string_view processInks[] = {"Cyan", "Magenta", "Yellow", "Black"};
constexpr const char* processNames[] = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
constexpr std::string_view rgbParts[] = {"R", "G", "B"};
constexpr const char* rgbNames[] = {"RGB_R", "RGB_G", "RGB_B"};
constexpr std::size_t mostInks = 64;

std::string counted(std::size_t count, const char* one, const char* many) {
    return std::to_string(count) + ' ' + (count == 1 ? one : many);
}

/// A patch, before its values are read. At least one of the two is set.
struct Patch {
    const Object* device = nullptr;
    const Object* colour = nullptr;
};

// Measurement conditions ------------------------------------------------------------------------

/// The condition whose values are read; empty if the file states none.
std::string chosenCondition(const Content& content, const std::string& wanted,
                            cgats::Notes& notes) {
    std::set<std::string_view> stated;
    for (const Value& value : content.values) {
        stated.insert(value.condition);
    }
    stated.erase(std::string_view());
    if (stated.empty()) {
        return {};
    }
    std::string chosen(*stated.begin());
    for (const std::string_view condition : {std::string_view(wanted), std::string_view("M1"),
                                             std::string_view("M0"), std::string_view("M2")}) {
        if (stated.count(condition) > 0) {
            chosen = condition;
            break;
        }
    }
    if (stated.size() > 1) {
        std::string list;
        for (const std::string_view condition : stated) {
            list.append(list.empty() ? "" : ", ").append(condition);
        }
        notes.add("There are measurements under " + list + ": those under " + chosen +
                  " are used.");
    }
    return chosen;
}

/// True if the light and observer are those of a data set, as far as they are stated.
bool isUsual(const Conditions& conditions) {
    return (conditions.illuminant.empty() || conditions.illuminant == "D50") &&
           (conditions.observer.empty() || conditions.observer == "2");
}

/// The best of an object's values of one kind: under the condition, then under none that is stated;
/// among these for D50 and 2 degrees first. Null if there is none.
const Value* valueOf(const Content& content, const Object& object, Value::Kind kind,
                     std::string_view condition) {
    const Value* best = nullptr;
    int bestRank = 0;
    for (std::size_t i = object.firstValue; i < object.firstValue + object.valueCount; ++i) {
        const Value& value = content.values[i];
        if (value.kind != kind || (!value.condition.empty() && value.condition != condition)) {
            continue;
        }
        const bool usual =
            value.specification == nullptr || isUsual(value.specification->conditions);
        const int rank = 1 + (value.condition == condition ? 2 : 0) + (usual ? 1 : 0);
        if (rank > bestRank) {
            best = &value;
            bestRank = rank;
        }
    }
    return best;
}

bool isUnder(const Content& content, const Object& object, std::string_view condition) {
    for (std::size_t i = object.firstValue; i < object.firstValue + object.valueCount; ++i) {
        const std::string_view stated = content.values[i].condition;
        if (stated.empty() || stated == condition) {
            return true;
        }
    }
    return false;
}

// Targets and measurements ----------------------------------------------------------------------

using Objects = std::vector<const Object*>;
using Key = std::string_view (*)(const Object&);

constexpr Key keys[] = {
    [](const Object& object) -> std::string_view { return object.location; },
    [](const Object& object) { return object.sampleId; },
    [](const Object& object) { return object.name; },
    [](const Object& object) { return object.id; },
};

/// For each measurement the index of the target of the same key, or -1. Nothing if two targets
/// share a key.
std::vector<std::ptrdiff_t> joined(const Objects& targets, const Objects& measurements, Key key) {
    std::unordered_map<std::string_view, std::ptrdiff_t> byKey;
    for (const Object* target : targets) {
        const std::string_view name = key(*target);
        if (name.empty() ||
            !byKey.try_emplace(name, static_cast<std::ptrdiff_t>(byKey.size())).second) {
            return {};
        }
    }
    std::vector<std::ptrdiff_t> partners;
    partners.reserve(measurements.size());
    for (const Object* measurement : measurements) {
        const auto found = byKey.find(key(*measurement));
        partners.push_back(found != byKey.end() ? found->second : -1);
    }
    return partners;
}

std::size_t partnerCount(const std::vector<std::ptrdiff_t>& partners) {
    return static_cast<std::size_t>(std::count_if(
        partners.begin(), partners.end(), [](std::ptrdiff_t partner) { return partner >= 0; }));
}

std::vector<std::ptrdiff_t> bestJoin(const Objects& targets, const Objects& measurements,
                                     cgats::Notes& notes) {
    std::vector<std::ptrdiff_t> best;
    for (const Key key : keys) {
        std::vector<std::ptrdiff_t> partners = joined(targets, measurements, key);
        if (partnerCount(partners) > partnerCount(best)) {
            best = std::move(partners);
        }
    }
    if (best.empty() && targets.size() == measurements.size()) {
        for (std::size_t i = 0; i < targets.size(); ++i) {
            best.push_back(static_cast<std::ptrdiff_t>(i));
        }
        notes.add("Targets and measurements have no place, id or name in common: they are joined "
                  "in their order.");
    }
    return best;
}

/// Joins device values and colours to patches.
std::vector<Patch> patchesOf(const Content& content, const std::string& condition,
                             cgats::Notes& notes) {
    Objects targets;      // Device values, perhaps with colours.
    Objects measurements; // Colours alone.
    std::size_t complete = 0;
    for (const Object& object : content.objects) {
        if (object.hasDevice()) {
            targets.push_back(&object);
            complete += object.hasColour() ? 1 : 0;
        } else if (isUnder(content, object, condition)) {
            measurements.push_back(&object);
        }
    }
    std::vector<Patch> patches;
    if (targets.empty()) {
        for (const Object* object : measurements) {
            patches.push_back({nullptr, object});
        }
        return patches;
    }
    const std::vector<std::ptrdiff_t> partners = measurements.empty()
                                                     ? std::vector<std::ptrdiff_t>()
                                                     : bestJoin(targets, measurements, notes);
    const std::size_t joinedCount = partnerCount(partners);

    // The measurements of each target, in the file's order.
    std::vector<Objects> ofTarget(targets.size());
    for (std::size_t i = 0; i < partners.size(); ++i) {
        if (partners[i] >= 0) {
            ofTarget[static_cast<std::size_t>(partners[i])].push_back(measurements[i]);
        }
    }
    std::size_t unmeasured = 0;
    for (std::size_t i = 0; i < targets.size(); ++i) {
        for (const Object* measurement : ofTarget[i]) {
            patches.push_back({targets[i], measurement});
        }
        if (!ofTarget[i].empty()) {
            continue;
        }
        if (targets[i]->hasColour() && isUnder(content, *targets[i], condition)) {
            patches.push_back({targets[i], targets[i]});
        } else if (joinedCount + complete == 0) {
            patches.push_back({targets[i], nullptr}); // A chart that nobody has measured.
        } else {
            ++unmeasured;
        }
    }
    if (unmeasured > 0) {
        notes.add(counted(unmeasured, "object has", "objects have") +
                  " device values without a measurement, and are left out.");
    }
    if (joinedCount < measurements.size()) {
        notes.add(counted(measurements.size() - joinedCount, "object has", "objects have") +
                  " colours without device values among objects with them, and are left out.");
    }
    return patches;
}

// Values ----------------------------------------------------------------------------------------

class SetReader {
  public:
    SetReader(const Document& document, const Content& content, const std::string& condition,
              cgats::Notes& notes)
        : m_document(document), m_content(content), m_condition(condition), m_notes(notes) {}

    /// On success the table is as a reader of CGATS text makes one: scales are not decided yet.
    Failure read(const std::vector<Patch>& patches, cgats::Table& table) {
        m_table = &table;
        table.set.patchCount = patches.size();
        Failure failure = readDevice(patches);
        if (failure == Failure::None) {
            failure = readColours(patches);
        }
        if (failure == Failure::None) {
            readLabels(patches);
            readHeader();
        }
        return failure;
    }

  private:
    std::string text(pugi::xml_node parent, std::string_view name) const {
        std::string storage;
        return cgats::toUtf8(textOf(m_document.child(parent, name), storage));
    }

    std::optional<double> number(pugi::xml_node parent, std::string_view name) {
        return numberOf(textOf(m_document.child(parent, name), m_storage));
    }

    // Device values

    Failure readDevice(const std::vector<Patch>& patches) {
        DeviceKind kind = DeviceKind::None;
        for (const Patch& patch : patches) {
            if (patch.device == nullptr) {
                continue;
            }
            if (kind != DeviceKind::None && patch.device->deviceKind != kind) {
                return Failure::Damaged;
            }
            kind = patch.device->deviceKind;
        }
        switch (kind) {
        case DeviceKind::None:
            return Failure::None;
        case DeviceKind::Rgb:
            return readRgb(patches);
        case DeviceKind::Cmyk:
        case DeviceKind::Custom:
            break;
        }
        return readInks(patches, kind);
    }

    Failure readRgb(const std::vector<Patch>& patches) {
        DataSet& set = m_table->set;
        set.deviceSpace = DeviceSpace::Rgb;
        set.channels.assign(std::begin(rgbNames), std::end(rgbNames));
        constexpr double usualRange = 255;
        for (const Patch& patch : patches) {
            const pugi::xml_node node = patch.device->device;
            const bool states = static_cast<bool>(m_document.child(node, "MaxRange"));
            const std::optional<double> range =
                states ? number(node, "MaxRange") : std::optional(usualRange);
            for (const std::string_view part : rgbParts) {
                const std::optional<double> value = number(node, part);
                if (!value || !range || *range <= 0) {
                    return Failure::NotNumeric;
                }
                set.device.push_back(*value * 100 / *range);
            }
        }
        return Failure::None;
    }

    /// C, M, Y, K and inks by name. An ink that a patch does not name is not printed there.
    Failure readInks(const std::vector<Patch>& patches, DeviceKind kind) {
        m_inks.clear();
        if (kind == DeviceKind::Cmyk) {
            m_inks.assign(std::begin(processInks), std::end(processInks));
        }
        const std::size_t fixed = m_inks.size();
        struct Amount {
            std::size_t patch;
            std::size_t ink;
            double percent;
        };
        std::vector<Amount> amounts;
        for (std::size_t i = 0; i < patches.size(); ++i) {
            const pugi::xml_node node = patches[i].device->device;
            for (std::size_t ink = 0; ink < fixed; ++ink) {
                const std::optional<double> percent = number(node, m_inks[ink]);
                if (!percent) {
                    return Failure::NotNumeric;
                }
                amounts.push_back({i, ink, *percent});
            }
            for (pugi::xml_node spot = node.first_child(); spot; spot = spot.next_sibling()) {
                if (!m_document.is(spot, "SpotColor")) {
                    continue;
                }
                const std::optional<double> percent = number(spot, "Percentage");
                const std::string name = text(spot, "Name");
                if (!percent || name.empty()) {
                    return Failure::NotNumeric;
                }
                amounts.push_back({i, inkNamed(name, fixed), *percent});
                if (m_inks.size() > mostInks) {
                    return Failure::TooLarge;
                }
            }
        }
        DataSet& set = m_table->set;
        set.device.assign(patches.size() * m_inks.size(), 0);
        for (const Amount& amount : amounts) {
            set.device[amount.patch * m_inks.size() + amount.ink] = amount.percent;
        }
        nameChannels(kind);
        return m_inks.empty() ? Failure::NoDeviceValues : Failure::None;
    }

    /// Place of a named ink, which may be new. C, M, Y and K of the first `fixed` places are no
    /// spot colours, whatever a spot colour is called.
    std::size_t inkNamed(const std::string& name, std::size_t fixed) {
        const auto start = m_inks.begin() + static_cast<std::ptrdiff_t>(fixed);
        const auto found = std::find(start, m_inks.end(), name);
        const auto place = static_cast<std::size_t>(found - m_inks.begin());
        if (found == m_inks.end()) {
            m_inks.push_back(name);
        }
        return place;
    }

    /// Inks that are all given by name are CMYK if the four are among them.
    void nameChannels(DeviceKind kind) {
        DataSet& set = m_table->set;
        set.deviceSpace = DeviceSpace::Cmyk;
        if (kind == DeviceKind::Custom && !bringProcessInksToFront()) {
            set.deviceSpace = DeviceSpace::Other;
            set.channels = m_inks;
            return;
        }
        set.channels.assign(std::begin(processNames), std::end(processNames));
        set.channels.insert(set.channels.end(), m_inks.begin() + 4, m_inks.end());
    }

    bool bringProcessInksToFront() {
        std::vector<std::size_t> order;
        for (const std::string_view ink : processInks) {
            const auto found =
                std::find_if(m_inks.begin(), m_inks.end(),
                             [&](const std::string& name) { return cgats::sameWord(name, ink); });
            if (found == m_inks.end()) {
                return false;
            }
            order.push_back(static_cast<std::size_t>(found - m_inks.begin()));
        }
        for (std::size_t ink = 0; ink < m_inks.size(); ++ink) {
            if (std::find(order.begin(), order.end(), ink) == order.end()) {
                order.push_back(ink);
            }
        }
        DataSet& set = m_table->set;
        std::vector<double> device;
        device.reserve(set.device.size());
        for (std::size_t patch = 0; patch < set.patchCount; ++patch) {
            for (const std::size_t ink : order) {
                device.push_back(set.device[patch * m_inks.size() + ink]);
            }
        }
        set.device = std::move(device);
        std::vector<std::string> inks;
        for (const std::size_t ink : order) {
            inks.push_back(m_inks[ink]);
        }
        m_inks = std::move(inks);
        return true;
    }

    // Colours

    Failure readColours(const std::vector<Patch>& patches) {
        std::size_t measured = 0;
        for (const Patch& patch : patches) {
            if (patch.colour == nullptr) {
                continue;
            }
            ++measured;
            const Object& object = *patch.colour;
            bool sound = true;
            if (const Value* lab = valueOf(m_content, object, Value::Lab, m_condition)) {
                sound = addLab(*lab);
            } else if (const Value* lch = valueOf(m_content, object, Value::LCh, m_condition)) {
                sound = addLch(*lch);
            }
            if (const Value* xyz = valueOf(m_content, object, Value::Xyz, m_condition)) {
                sound = sound && addXyz(*xyz);
            }
            if (const Value* spectrum = valueOf(m_content, object, Value::Spectrum, m_condition)) {
                sound = sound && addSpectrum(*spectrum);
            }
            if (!sound) {
                return Failure::NotNumeric;
            }
        }
        return settleColours(measured);
    }

    bool addLab(const Value& value) {
        const auto L = number(value.node, "L");
        const auto a = number(value.node, "A");
        const auto b = number(value.node, "B");
        if (!L || !a || !b) {
            return false;
        }
        m_table->set.lab.push_back({*L, *a, *b});
        see(value);
        return true;
    }

    bool addLch(const Value& value) {
        const auto L = number(value.node, "L");
        const auto chroma = number(value.node, "C");
        const auto hue = number(value.node, "H");
        if (!L || !chroma || !hue) {
            return false;
        }
        const double angle = *hue * std::numbers::pi / 180;
        m_table->set.lab.push_back({*L, *chroma * std::cos(angle), *chroma * std::sin(angle)});
        see(value);
        return true;
    }

    bool addXyz(const Value& value) {
        const auto X = number(value.node, "X");
        const auto Y = number(value.node, "Y");
        const auto Z = number(value.node, "Z");
        if (!X || !Y || !Z) {
            return false;
        }
        m_table->set.xyz.push_back({*X, *Y, *Z});
        see(value);
        return true;
    }

    bool addSpectrum(const Value& value) {
        std::vector<double>& spectra = m_table->set.spectra;
        const std::size_t before = spectra.size();
        std::string_view rest = textOf(value.node, m_storage);
        constexpr std::string_view blanks = " \t\r\n";
        while (true) {
            rest.remove_prefix(std::min(rest.find_first_not_of(blanks), rest.size()));
            if (rest.empty()) {
                break;
            }
            const std::string_view word = rest.substr(0, rest.find_first_of(blanks));
            const std::optional<double> reflectance = numberOf(word);
            if (!reflectance) {
                return false;
            }
            spectra.push_back(*reflectance);
            rest.remove_prefix(word.size());
        }
        const SpectralAxis axis = axisOf(value, spectra.size() - before);
        if (m_spectrumCount++ == 0) {
            m_table->set.axis = axis;
        } else if (axis.base != m_table->set.axis.base || axis.step != m_table->set.axis.step ||
                   axis.length != m_table->set.axis.length) {
            m_axesDiffer = true;
        }
        m_spectralSpecification = value.specification;
        return true;
    }

    /// Where a file does not state the wavelengths, they are those that end with the visible light.
    /// Step 0 if they can't be told.
    SpectralAxis axisOf(const Value& value, std::size_t count) const {
        const auto length = static_cast<int>(std::min<std::size_t>(count, 100'000));
        const Specification* const specification = value.specification;
        const auto own = value.node.attribute("StartWL").as_int(0);
        int base = own > 0                    ? own
                   : specification != nullptr ? specification->firstWavelength.value_or(0)
                                              : 0;
        if (base <= 0) {
            base = length == 31 ? 400 : 380;
        }
        if (specification != nullptr && specification->increment) {
            return {base, *specification->increment, length};
        }
        constexpr int earliestEnd = 700;
        constexpr int latestEnd = 830;
        for (const int step : {10, 20, 5, 1}) {
            const int last = base + step * (length - 1);
            if (last >= earliestEnd && last <= latestEnd) {
                return {base, step, length};
            }
        }
        return {base, 0, length};
    }

    /// Keeps what the colorimetric values are stated for. Statements that differ cancel out.
    void see(const Value& value) {
        const Conditions stated =
            value.specification != nullptr ? value.specification->conditions : Conditions{};
        if (!m_seen) {
            m_stated = stated;
            m_seen = true;
        }
        m_lastSpecification = value.specification;
        if (m_stated.illuminant != stated.illuminant) {
            m_stated.illuminant.clear();
        }
        if (m_stated.observer != stated.observer) {
            m_stated.observer.clear();
        }
    }

    /// A quantity counts if every measured patch has it.
    Failure settleColours(std::size_t measured) {
        DataSet& set = m_table->set;
        bool partial = false;
        const auto settle = [&](std::size_t count, const char* name, auto clear) {
            if (count == 0 || count == set.patchCount) {
                return;
            }
            partial = true;
            clear();
            m_notes.add(std::string("Only ") + counted(count, "object has ", "objects have ") +
                        name + ": it does not count.");
        };
        settle(set.lab.size(), "L*a*b*", [&] { set.lab.clear(); });
        settle(set.xyz.size(), "XYZ", [&] { set.xyz.clear(); });
        settle(m_spectrumCount, "a spectrum", [&] { dropSpectra(); });
        if (!set.spectra.empty() && (m_axesDiffer || set.axis.step == 0)) {
            m_notes.add(m_axesDiffer
                            ? "The spectra have different wavelengths and are left out."
                            : "The wavelengths of the spectra are not stated: they are left out.");
            dropSpectra();
            m_table->unevenSpectra = true;
        }
        set.conditions = m_stated;
        set.conditions.measurement = m_condition;
        if (!isUsual(m_stated) && !set.spectra.empty() && spectraUsable(set.axis)) {
            set.lab.clear();
            set.xyz.clear();
            m_notes.add("The colour values are stated for " + describe(m_stated) +
                        ": those of the spectra are used.");
        }
        const bool none = set.lab.empty() && set.xyz.empty() && set.spectra.empty();
        return none && (partial || measured > 0) && !m_table->unevenSpectra
                   ? (partial ? Failure::Damaged : Failure::NoColourValues)
                   : Failure::None;
    }

    static std::string describe(const Conditions& conditions) {
        std::string words = conditions.illuminant.empty() ? "D50" : conditions.illuminant;
        return words + " and " + (conditions.observer.empty() ? "2" : conditions.observer) +
               " degrees";
    }

    void dropSpectra() {
        m_table->set.spectra.clear();
        m_table->set.axis = {};
    }

    // Texts

    void readLabels(const std::vector<Patch>& patches) {
        DataSet& set = m_table->set;
        std::set<std::string_view> sampleIds;
        const auto labels = [](const Patch& patch) -> const Object& {
            return patch.device != nullptr ? *patch.device : *patch.colour;
        };
        for (const Patch& patch : patches) {
            const std::string_view id = labels(patch).sampleId;
            if (id.empty() || !sampleIds.insert(id).second) {
                sampleIds.clear();
                break;
            }
        }
        set.ids.reserve(patches.size());
        set.names.reserve(patches.size());
        for (const Patch& patch : patches) {
            const Object& object = labels(patch);
            set.ids.push_back(cgats::toUtf8(sampleIds.empty() ? object.id : object.sampleId));
            set.names.push_back(
                cgats::toUtf8(object.sampleName.empty() ? object.name : object.sampleName));
        }
        const auto allEmpty = [](const std::vector<std::string>& texts) {
            return std::all_of(texts.begin(), texts.end(),
                               [](const std::string& text) { return text.empty(); });
        };
        if (allEmpty(set.ids)) {
            set.ids.clear();
        }
        if (allEmpty(set.names)) {
            set.names.clear();
        }
    }

    void readHeader() {
        DataSet& set = m_table->set;
        const pugi::xml_node information = m_document.child(m_document.root(), "FileInformation");
        const auto bounded = [](std::string words) {
            words.resize(std::min(words.size(), cgats::maxHeaderValue));
            return cgats::toUtf8(words);
        };
        set.originator = bounded(text(information, "Creator"));
        set.created = bounded(text(information, "CreationDate"));
        set.descriptor = bounded(text(information, "Description"));
        const Specification* const specification =
            m_spectralSpecification != nullptr ? m_spectralSpecification : m_lastSpecification;
        if (specification != nullptr) {
            set.instrumentation = bounded(specification->instrument);
        }
        if (!m_document.hasNamespace()) {
            m_notes.add("The file does not state the namespace of its elements.");
        }
    }

    const Document& m_document;
    const Content& m_content;
    const std::string& m_condition;
    cgats::Notes& m_notes;
    cgats::Table* m_table = nullptr;
    std::vector<std::string> m_inks;
    std::string m_storage;
    std::size_t m_spectrumCount = 0;
    bool m_axesDiffer = false;
    bool m_seen = false;
    Conditions m_stated;
    const Specification* m_lastSpecification = nullptr;
    const Specification* m_spectralSpecification = nullptr;
};

Failure readFile(std::string_view utf8, const CgatsWants& wants, DataSet& set) {
    Document document;
    if (const Failure failure = document.load(utf8); failure != Failure::None) {
        return failure;
    }
    const Content content = contentOf(document);
    if (content.objects.size() > maxCgatsPatches) {
        return Failure::TooLarge;
    }
    cgats::Notes notes;
    const std::string condition = chosenCondition(content, wants.condition, notes);
    cgats::Table table;
    SetReader reader(document, content, condition, notes);
    if (const Failure failure = reader.read(patchesOf(content, condition, notes), table);
        failure != Failure::None) {
        return failure;
    }
    if (const Failure failure = complete(table, cgats::ScaleHint::None, wants, notes);
        failure != Failure::None) {
        return failure;
    }
    set = std::move(table.set);
    set.notes = notes.take();
    return Failure::None;
}

} // namespace

bool looksLikeCxf(std::string_view bytes) {
    std::string decoded;
    constexpr std::size_t head = std::size_t{1} << 16;
    return cxf::hasRoot(withoutUtf16(bytes.substr(0, head), decoded));
}

Failure readCxf(std::string_view bytes, const CgatsWants& wants, DataSet& set) {
    try {
        std::string decoded;
        return readFile(withoutUtf16(bytes, decoded), wants, set);
    } catch (const std::bad_alloc&) {
        return Failure::OutOfMemory;
    } catch (const std::length_error&) {
        return Failure::OutOfMemory;
    }
}

} // namespace colour
