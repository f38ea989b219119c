// SPDX-License-Identifier: Apache-2.0
// The parts of a CxF3 file that are read:
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
// CxfXml.h parses the file, CxfObjects.h lists its objects, and this file converts them to patches.
#include "colour/Cxf.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <new>
#include <numbers>
#include <set>
#include <stdexcept>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include "colour/CgatsLines.h"
#include "colour/CgatsNumbers.h"
#include "colour/CgatsTables.h"
#include "colour/CxfObjects.h"
#include "colour/TextEncoding.h"

namespace colour {
namespace {

using namespace cxf;

constexpr std::string_view processInks[] = {"Cyan", "Magenta", "Yellow", "Black"};
constexpr const char* processNames[] = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
constexpr const char* rgbNames[] = {"RGB_R", "RGB_G", "RGB_B"};
constexpr std::size_t mostInks = 64;

std::string counted(std::size_t count, const char* one, const char* many) {
    return std::to_string(count) + ' ' + (count == 1 ? one : many);
}

/// A patch whose values have not been read yet. At least one of the two is set.
struct Patch {
    const Object* device = nullptr;
    const Object* colour = nullptr;
};

// Measurement conditions ------------------------------------------------------------------------

std::string conditionName(int condition) {
    return condition == unstated ? "" : "M" + std::to_string(condition);
}

/// The condition whose values are read. `unstated` if the file states none.
std::int8_t chosenCondition(const Content& content, const std::string& wanted,
                            cgats::Notes& notes) {
    bool stated[4] = {};
    for (const Value& value : content.values) {
        if (value.condition != unstated) {
            stated[value.condition] = true;
        }
    }
    constexpr std::int8_t order[] = {1, 0, 2, 3};
    std::int8_t chosen = unstated;
    std::string list;
    int count = 0;
    for (const std::int8_t condition : order) {
        if (!stated[condition]) {
            continue;
        }
        ++count;
        if (chosen == unstated || conditionName(condition) == wanted) {
            chosen = condition;
        }
    }
    if (count > 1) {
        for (std::int8_t condition = 0; condition < 4; ++condition) {
            if (stated[condition]) {
                list += (list.empty() ? "" : ", ") + conditionName(condition);
            }
        }
        notes.add("There are measurements under " + list + ": those under " +
                  conditionName(chosen) + " are used.");
    }
    return chosen;
}

/// The best of an object's values of one kind: first for the condition, then without a stated
/// condition; within each, D50 and 2 degrees first. Null if there is none.
const Value* valueOf(const Content& content, const Object& object, Value::Kind kind,
                     std::int8_t condition) {
    const Value* best = nullptr;
    int bestRank = 0;
    for (std::size_t i = object.firstValue; i < object.firstValue + object.valueCount; ++i) {
        const Value& value = content.values[i];
        if (value.kind != kind || (value.condition != unstated && value.condition != condition)) {
            continue;
        }
        const bool usual =
            value.colorSpecification == nullptr || value.colorSpecification->conditions.areUsual();
        const int rank = 1 + (value.condition == condition ? 2 : 0) + (usual ? 1 : 0);
        if (rank > bestRank) {
            best = &value;
            bestRank = rank;
        }
    }
    return best;
}

bool isUnder(const Content& content, const Object& object, std::int8_t condition) {
    for (std::size_t i = object.firstValue; i < object.firstValue + object.valueCount; ++i) {
        const std::int8_t stated = content.values[i].condition;
        if (stated == unstated || stated == condition) {
            return true;
        }
    }
    return false;
}

// Targets and measurements ----------------------------------------------------------------------

using Objects = std::vector<const Object*>;
using Labels = std::vector<std::string>;

/// Labels that may identify the target of a measurement, most reliable kind first.
Labels labelsOf(const Document& document, const Objects& objects, int kind) {
    Labels labels;
    labels.reserve(objects.size());
    for (const Object* object : objects) {
        switch (kind) {
        case 0:
            labels.push_back(placeOf(document, *object).position);
            break;
        case 1:
            labels.emplace_back(placeOf(document, *object).sampleId);
            break;
        case 2:
            labels.emplace_back(object->name);
            break;
        default:
            labels.emplace_back(object->id);
            break;
        }
    }
    return labels;
}
constexpr int labelKinds = 4;

/// For each measurement, the index of the target with the same label, or -1. Empty if a target has
/// no label or shares it.
std::vector<std::ptrdiff_t> joined(const Labels& targets, const Labels& measurements) {
    std::unordered_map<std::string_view, std::ptrdiff_t> byLabel;
    for (std::size_t i = 0; i < targets.size(); ++i) {
        if (targets[i].empty() ||
            !byLabel.try_emplace(targets[i], static_cast<std::ptrdiff_t>(i)).second) {
            return {};
        }
    }
    std::vector<std::ptrdiff_t> partners;
    partners.reserve(measurements.size());
    for (const std::string& label : measurements) {
        const auto found = byLabel.find(label);
        partners.push_back(found != byLabel.end() ? found->second : -1);
    }
    return partners;
}

std::size_t partnerCount(const std::vector<std::ptrdiff_t>& partners) {
    return static_cast<std::size_t>(std::count_if(
        partners.begin(), partners.end(), [](std::ptrdiff_t partner) { return partner >= 0; }));
}

/// Order counts only if no target has colours. Otherwise a measurement may belong to anything.
std::vector<std::ptrdiff_t> bestJoin(const Document& document, const Objects& targets,
                                     const Objects& measurements, bool orderCounts,
                                     cgats::Notes& notes) {
    std::vector<std::ptrdiff_t> best;
    for (int kind = 0; kind < labelKinds && partnerCount(best) < measurements.size(); ++kind) {
        std::vector<std::ptrdiff_t> partners =
            joined(labelsOf(document, targets, kind), labelsOf(document, measurements, kind));
        if (partnerCount(partners) > partnerCount(best)) {
            best = std::move(partners);
        }
    }
    if (best.empty() && orderCounts && targets.size() == measurements.size()) {
        for (std::size_t i = 0; i < targets.size(); ++i) {
            best.push_back(static_cast<std::ptrdiff_t>(i));
        }
        notes.add("Targets and measurements have no place, id or name in common: they are joined "
                  "in their order.");
    }
    return best;
}

/// Joins device values and colours into patches.
std::vector<Patch> patchesOf(const Document& document, const Content& content,
                             std::int8_t condition, cgats::Notes& notes) {
    Objects targets;      // With device values, perhaps with colours.
    Objects measurements; // Only colours.
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
    const std::vector<std::ptrdiff_t> partners =
        measurements.empty() ? std::vector<std::ptrdiff_t>()
                             : bestJoin(document, targets, measurements, complete == 0, notes);
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
            if (targets[i]->hasColour()) {
                notes.add("Objects with device values and colours have measurements of their own, "
                          "which are used.");
            }
            continue;
        }
        if (targets[i]->hasColour() && isUnder(content, *targets[i], condition)) {
            patches.push_back({targets[i], targets[i]});
        } else if (joinedCount + complete == 0) {
            patches.push_back({targets[i], nullptr}); // A chart that has not been measured.
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
    SetReader(const Document& document, const Content& content, std::int8_t condition, bool ascii,
              cgats::Notes& notes)
        : m_document(document), m_content(content), m_condition(condition), m_notes(notes),
          m_ascii(ascii) {}

    /// On success, the table is like one read from CGATS text: scales are not determined yet.
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

    /// False if the colour values in use are stated for an illuminant other than D50 or an observer
    /// other than 2 degrees.
    bool isUsual() const { return m_usual; }

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
        return takeDevice(patches, set.channels.size());
    }

    Failure takeDevice(const std::vector<Patch>& patches, std::size_t channels) {
        DataSet& set = m_table->set;
        set.device.reserve(patches.size() * channels);
        for (const Patch& patch : patches) {
            if (!patch.device->deviceSound) {
                return Failure::NotNumeric;
            }
            const double* const device = patch.device->device;
            set.device.insert(set.device.end(), device, device + channels);
        }
        return Failure::None;
    }

    /// C, M, Y, K and inks by name. If a patch does not name an ink, its amount is 0.
    Failure readInks(const std::vector<Patch>& patches, DeviceKind kind) {
        m_inks.clear();
        if (kind == DeviceKind::Cmyk) {
            m_inks.assign(std::begin(processInks), std::end(processInks));
        }
        const std::size_t fixed = m_inks.size();
        if (const Failure failure = takeDevice(patches, fixed); failure != Failure::None) {
            return failure;
        }
        struct Amount {
            std::size_t patch;
            std::size_t ink;
            double percent;
        };
        std::vector<Amount> amounts;
        bool sound = true;
        for (std::size_t i = 0; i < patches.size() && m_inks.size() <= mostInks; ++i) {
            m_document.forEach(patches[i].device->inks, m_spotColor, [&](pugi::xml_node spot) {
                const std::optional<double> percent = number(spot, "Percentage");
                const std::string name = text(spot, "Name");
                sound = sound && percent && !name.empty();
                amounts.push_back({i, inkNamed(name, fixed), percent.value_or(0)});
            });
        }
        if (!sound) {
            return Failure::NotNumeric;
        }
        if (m_inks.size() > mostInks) {
            return Failure::TooLarge;
        }
        if (!amounts.empty()) {
            widenDevice(fixed);
        }
        for (const Amount& amount : amounts) {
            m_table->set.device[amount.patch * m_inks.size() + amount.ink] = amount.percent;
        }
        if (m_inks.empty()) {
            return Failure::NoDeviceValues;
        }
        nameChannels(kind);
        return Failure::None;
    }

    /// Makes room for all inks after the first `fixed` ones of each patch.
    void widenDevice(std::size_t fixed) {
        DataSet& set = m_table->set;
        std::vector<double> wide(set.patchCount * m_inks.size(), 0);
        for (std::size_t patch = 0; patch < set.patchCount; ++patch) {
            std::copy_n(set.device.begin() + static_cast<std::ptrdiff_t>(patch * fixed), fixed,
                        wide.begin() + static_cast<std::ptrdiff_t>(patch * m_inks.size()));
        }
        set.device = std::move(wide);
    }

    /// Index of a named ink, added if new. C, M, Y and K at the first `fixed` places are not spot
    /// colours, even if a spot colour has such a name.
    std::size_t inkNamed(const std::string& name, std::size_t fixed) {
        const auto start = m_inks.begin() + static_cast<std::ptrdiff_t>(fixed);
        const auto found = std::find(start, m_inks.end(), name);
        const auto place = static_cast<std::size_t>(found - m_inks.begin());
        if (found == m_inks.end()) {
            m_inks.push_back(name);
        }
        return place;
    }

    /// If all inks are given by name, they are CMYK if these four are among them.
    void nameChannels(DeviceKind kind) {
        DataSet& set = m_table->set;
        set.deviceSpace = DeviceSpace::Cmyk;
        if (kind == DeviceKind::Custom && !bringProcessInksToFront()) {
            set.deviceSpace = DeviceSpace::Other;
        } else {
            set.channels.assign(std::begin(processNames), std::end(processNames));
        }
        // Named like columns of CGATS text, so that the names survive there.
        for (std::size_t ink = set.channels.size(); ink < m_inks.size(); ++ink) {
            set.channels.push_back("SPOT_" + m_inks[ink]);
        }
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
        const auto& [L, a, b] = value.numbers;
        m_table->set.lab.push_back({L, a, b});
        see(value, m_labLight);
        return value.sound;
    }

    bool addLch(const Value& value) {
        const auto& [L, chroma, hue] = value.numbers;
        const double angle = hue * std::numbers::pi / 180;
        m_table->set.lab.push_back({L, chroma * std::cos(angle), chroma * std::sin(angle)});
        see(value, m_labLight);
        return value.sound;
    }

    bool addXyz(const Value& value) {
        const auto& [X, Y, Z] = value.numbers;
        m_table->set.xyz.push_back({X, Y, Z});
        see(value, m_xyzLight);
        return value.sound;
    }

    bool addSpectrum(const Value& value) {
        std::vector<double>& spectra = m_table->set.spectra;
        const std::size_t before = spectra.size();
        const std::string_view text = textOf(value.spectrum, m_storage);
        const char* const end = text.data() + text.size();
        const cgats::CharTable& chars = cgats::blanksSeparate;
        const auto skip = [&](const char* at) {
            while (at != end && !chars.isPlain(*at)) {
                ++at;
            }
            return at;
        };
        for (const char* at = skip(text.data()); at != end; at = skip(at)) {
            double reflectance = 0;
            if (!m_numbers.readPlain(at, end, reflectance)) {
                const char* const start = at;
                at = std::find_if_not(at, end, [&](char c) { return chars.isPlain(c); });
                const std::optional<double> number =
                    numberOf({start, static_cast<std::size_t>(at - start)});
                if (!number) {
                    return false;
                }
                reflectance = *number;
            }
            spectra.push_back(reflectance);
        }
        if (m_numbers.sawCommas()) {
            return false;
        }
        const SpectralAxis axis = axisOf(value, spectra.size() - before);
        if (m_spectrumCount++ == 0) {
            m_table->set.axis = axis;
        } else if (axis.base != m_table->set.axis.base || axis.step != m_table->set.axis.step ||
                   axis.length != m_table->set.axis.length) {
            m_axesDiffer = true;
        }
        m_spectralSpecification = value.colorSpecification;
        return true;
    }

    /// If a file does not state the wavelengths, they are assumed to end with the visible range.
    /// The step is 0 if that is not possible.
    SpectralAxis axisOf(const Value& value, std::size_t count) const {
        const auto length = static_cast<int>(std::min<std::size_t>(count, 100'000));
        const ColorSpecification* const colorSpecification = value.colorSpecification;
        const auto own = value.spectrum.attribute("StartWL").as_int(0);
        int base = own > 0                         ? own
                   : colorSpecification != nullptr ? colorSpecification->firstWavelength.value_or(0)
                                                   : 0;
        if (base <= 0) {
            base = length == 31 ? 400 : 380;
        }
        if (colorSpecification != nullptr && colorSpecification->increment) {
            return {base, *colorSpecification->increment, length};
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

    /// The stated conditions of one quantity's values.
    struct Light {
        bool seen = false;
        Conditions stated; ///< The first statement that is not D50 and 2 degrees, if any.
        const ColorSpecification* last = nullptr;
    };

    /// Usual statements that differ (one states D50, the other nothing) cancel out.
    void see(const Value& value, Light& light) {
        if (light.seen && value.colorSpecification == light.last) {
            return;
        }
        light.last = m_lastSpecification = value.colorSpecification;
        const Conditions stated = value.colorSpecification != nullptr
                                      ? value.colorSpecification->conditions
                                      : Conditions{};
        if (!std::exchange(light.seen, true) || (light.stated.areUsual() && !stated.areUsual())) {
            light.stated = stated;
        } else if (light.stated.areUsual()) {
            cancel(light.stated, stated);
        }
    }

    static void cancel(Conditions& kept, const Conditions& other) {
        if (kept.illuminant != other.illuminant) {
            kept.illuminant.clear();
        }
        if (kept.observer != other.observer) {
            kept.observer.clear();
        }
    }

    /// The conditions of the colour values in use. If L*a*b* and XYZ are stated for different ones,
    /// only those for D50 and 2 degrees are used.
    Conditions settleLight() {
        DataSet& set = m_table->set;
        if (!set.lab.empty() && !set.xyz.empty() &&
            m_labLight.stated.areUsual() != m_xyzLight.stated.areUsual()) {
            m_notes.add("L*a*b* and XYZ are for different conditions: those for D50 and 2 degrees "
                        "are used.");
            if (m_labLight.stated.areUsual()) {
                set.xyz.clear();
            } else {
                set.lab.clear();
            }
        }
        if (set.lab.empty() || set.xyz.empty()) {
            return !set.lab.empty()   ? m_labLight.stated
                   : !set.xyz.empty() ? m_xyzLight.stated
                                      : Conditions{};
        }
        Conditions both = m_labLight.stated;
        if (both.areUsual()) {
            cancel(both, m_xyzLight.stated);
        }
        return both;
    }

    /// A quantity is used only if every measured patch has it.
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
                        name + ": it is ignored.");
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
        set.conditions = settleLight();
        m_usual = set.conditions.areUsual();
        set.conditions.measurement = conditionName(m_condition);
        const bool none = set.lab.empty() && set.xyz.empty() && set.spectra.empty();
        return none && (partial || measured > 0) && !m_table->unevenSpectra
                   ? (partial ? Failure::Damaged : Failure::NoColourValues)
                   : Failure::None;
    }

    void dropSpectra() {
        m_table->set.spectra.clear();
        m_table->set.axis = {};
    }

    // Texts

    /// Except for character references, the text of an ASCII file is valid UTF-8 already.
    std::string labelOf(std::string_view text) const {
        return m_ascii ? std::string(text) : cgats::toUtf8(text);
    }

    void readLabels(const std::vector<Patch>& patches) {
        DataSet& set = m_table->set;
        const auto labels = [](const Patch& patch) -> const Object& {
            return patch.device != nullptr ? *patch.device : *patch.colour;
        };
        std::set<std::string_view> sampleIds;
        for (const Patch& patch : patches) {
            const std::string_view id = placeOf(m_document, labels(patch)).sampleId;
            if (id.empty() || !sampleIds.insert(id).second) {
                sampleIds.clear();
                break;
            }
        }
        set.ids.reserve(patches.size());
        set.names.reserve(patches.size());
        for (const Patch& patch : patches) {
            const Object& object = labels(patch);
            const Place place = object.location ? placeOf(m_document, object) : Place{};
            set.ids.push_back(labelOf(sampleIds.empty() ? object.id : place.sampleId));
            set.names.push_back(labelOf(place.sampleName.empty() ? object.name : place.sampleName));
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
        const ColorSpecification* const colorSpecification =
            m_spectralSpecification != nullptr ? m_spectralSpecification : m_lastSpecification;
        if (colorSpecification != nullptr) {
            set.instrumentation = bounded(colorSpecification->instrument);
        }
        if (!m_document.hasNamespace()) {
            m_notes.add("The file does not state the namespace of its elements.");
        }
    }

    const Document& m_document;
    const Content& m_content;
    const std::int8_t m_condition;
    cgats::Notes& m_notes;
    const bool m_ascii;
    cgats::Table* m_table = nullptr;
    const Name m_spotColor = m_document.name("SpotColor");
    std::vector<std::string> m_inks;
    std::string m_storage;
    cgats::NumberReader m_numbers{cgats::blanksSeparate};
    std::size_t m_spectrumCount = 0;
    bool m_axesDiffer = false;
    Light m_labLight;
    Light m_xyzLight;
    bool m_usual = true;
    const ColorSpecification* m_lastSpecification = nullptr;
    const ColorSpecification* m_spectralSpecification = nullptr;
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
    const std::int8_t condition = chosenCondition(content, wants.condition, notes);
    cgats::Table table;
    SetReader reader(document, content, condition, cgats::isAscii(utf8), notes);
    if (const Failure failure = reader.read(patchesOf(document, content, condition, notes), table);
        failure != Failure::None) {
        return failure;
    }
    CgatsWants completion = wants;
    completion.calculated = wants.calculated || !reader.isUsual();
    if (const Failure failure = complete(table, cgats::ScaleHint::None, completion, notes);
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
