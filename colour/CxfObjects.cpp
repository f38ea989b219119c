// SPDX-License-Identifier: Apache-2.0
#include "colour/CxfObjects.h"

#include <array>
#include <charconv>
#include <cstring>

#include "colour/CgatsNumbers.h"

namespace colour::cxf {
namespace {

constexpr struct {
    std::string_view name;
    Value::Kind kind;
} valueNames[] = {{"ReflectanceSpectrum", Value::Spectrum},
                  {"ColorCIELab", Value::Lab},
                  {"ColorCIELCh", Value::LCh},
                  {"ColorCIEXYZ", Value::Xyz}};

constexpr struct {
    std::string_view name;
    DeviceKind kind;
} deviceNames[] = {{"ColorCMYK", DeviceKind::Cmyk},
                   {"ColorCMYKPlusN", DeviceKind::Cmyk},
                   {"ColorRGB", DeviceKind::Rgb},
                   {"ColorCustom", DeviceKind::Custom}};

/// 1 from M1_Daylight, M1_Measurement and similar.
std::int8_t conditionIn(std::string_view text) {
    const bool stated =
        text.size() > 2 && text[0] == 'M' && text[1] >= '0' && text[1] <= '3' && text[2] == '_';
    return stated ? static_cast<std::int8_t>(text[1] - '0') : unstated;
}

std::optional<int> wholeNumber(const char* text) {
    const std::string_view digits = text;
    int number = 0;
    const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), number);
    const bool whole = error == std::errc() && end == digits.data() + digits.size();
    return whole && number > 0 && number < 100'000 ? std::optional(number) : std::nullopt;
}

class Reader {
  public:
    explicit Reader(const Document& document) : m_document(document) {
        for (std::size_t i = 0; i < std::size(valueNames); ++i) {
            m_valueNames[i] = document.name(valueNames[i].name);
        }
        for (std::size_t i = 0; i < std::size(deviceNames); ++i) {
            m_deviceNames[i] = document.name(deviceNames[i].name);
        }
    }

    Content read() {
        const pugi::xml_node resources = m_document.child(m_document.root(), "Resources");
        constexpr std::size_t elementsOfObject = 8; // Number of elements of a small object.
        m_content.objects.reserve(m_document.elementCount() / elementsOfObject);
        m_content.values.reserve(m_document.elementCount() / elementsOfObject);
        m_document.forEach(resources, "ColorSpecificationCollection", [&](pugi::xml_node all) {
            m_document.forEach(all, "ColorSpecification", [&](pugi::xml_node node) {
                m_content.specifications.try_emplace(node.attribute("Id").value(),
                                                     specificationOf(node));
            });
        });
        m_document.forEach(resources, "ObjectCollection", [&](pugi::xml_node all) {
            m_document.forEach(all, "Object", [&](pugi::xml_node node) { addObject(node); });
        });
        return std::move(m_content);
    }

  private:
    std::array<Name, 3> named(std::string_view a, std::string_view b, std::string_view c) const {
        return {m_document.name(a), m_document.name(b), m_document.name(c)};
    }

    std::string text(pugi::xml_node parent, std::string_view name) const {
        std::string storage;
        return std::string(textOf(m_document.child(parent, name), storage));
    }

    ColorSpecification specificationOf(pugi::xml_node node) const {
        ColorSpecification colorSpecification;
        const pugi::xml_node tristimulus = m_document.child(node, "TristimulusSpec");
        colorSpecification.conditions.illuminant = text(tristimulus, "Illuminant");
        if (m_document.child(tristimulus, "CustomIlluminant")) {
            colorSpecification.conditions.illuminant = "custom";
        }
        const std::string observer = text(tristimulus, "Observer");
        colorSpecification.conditions.observer = observer == "2_Degree"    ? "2"
                                                 : observer == "10_Degree" ? "10"
                                                                           : "";
        const pugi::xml_node measurement = m_document.child(node, "MeasurementSpec");
        const pugi::xml_node range = m_document.child(measurement, "WavelengthRange");
        colorSpecification.firstWavelength = wholeNumber(range.attribute("StartWL").value());
        colorSpecification.increment = wholeNumber(range.attribute("Increment").value());
        const pugi::xml_node device = m_document.child(measurement, "Device");
        colorSpecification.condition = measuredUnder(device);
        for (const char* part : {"Manufacturer", "Model", "SerialNumber"}) {
            const std::string word = text(device, part);
            if (!word.empty()) {
                colorSpecification.instrument +=
                    (colorSpecification.instrument.empty() ? "" : " ") + word;
            }
        }
        return colorSpecification;
    }

    /// The illumination has priority: filters for M2 and polarisers are mentioned elsewhere too.
    std::int8_t measuredUnder(pugi::xml_node device) const {
        const std::int8_t condition = conditionIn(text(device, "DeviceIllumination"));
        if (condition != unstated) {
            return condition;
        }
        const std::string polarised = text(device, "DevicePolarization");
        if (polarised == "true" || polarised == "1") {
            return 3;
        }
        return text(device, "DeviceFilter") == "Filter_UVExcluded" ? std::int8_t{2} : unstated;
    }

    const ColorSpecification* specificationNamed(const char* id) {
        // Nearly always the same as for the previous object.
        if (m_lastId != id) {
            const auto found = m_content.specifications.find(id);
            m_last = found != m_content.specifications.end() ? &found->second : nullptr;
            m_lastId = id;
        }
        return m_last;
    }

    void addObject(pugi::xml_node node) {
        Object& object = m_content.objects.emplace_back();
        object.id = node.attribute("Id").value();
        object.name = node.attribute("Name").value();
        object.firstValue = m_content.values.size();
        for (pugi::xml_node part = node.first_child(); part; part = part.next_sibling()) {
            if (m_document.is(part, m_colorValues)) {
                takeValues(part, node.attribute("ObjectType").value());
            } else if (m_document.is(part, m_deviceColorValues)) {
                takeDevice(part, object);
            } else if (m_document.is(part, m_tagCollection) &&
                       std::strcmp(part.attribute("Name").value(), "Location") == 0) {
                object.location = part;
            }
        }
        object.valueCount = static_cast<std::uint32_t>(m_content.values.size() - object.firstValue);
        if (!object.hasDevice() && !object.hasColour()) {
            m_content.objects.pop_back();
        }
    }

    /// The numbers of the children with these names, usually in this order. `next` is the node
    /// after the last of them.
    template<std::size_t N>
    bool numbers(pugi::xml_node parent, const std::array<Name, N>& names, double* values,
                 pugi::xml_node& next) {
        next = parent.first_child();
        for (std::size_t i = 0; i < N; ++i) {
            if (!next || !m_document.is(next, names[i])) {
                next = m_document.child(parent, names[i]);
            }
            if (!next || !numberOf(next, values[i])) {
                return false;
            }
            next = next.next_sibling();
        }
        return true;
    }

    bool numberOf(pugi::xml_node node, double& value) {
        const std::string_view text = textOf(node, m_storage);
        const char* at = text.data();
        const char* const end = at + text.size();
        if (at != end && m_numbers.readPlain(at, end, value) && at == end &&
            !m_numbers.sawCommas()) {
            return true;
        }
        const std::optional<double> number = cxf::numberOf(text);
        value = number.value_or(0);
        return number.has_value();
    }

    void takeDevice(pugi::xml_node values, Object& object) {
        for (pugi::xml_node node = values.first_child(); node; node = node.next_sibling()) {
            for (std::size_t i = 0; i < std::size(deviceNames); ++i) {
                if (m_document.is(node, m_deviceNames[i])) {
                    object.deviceKind = deviceNames[i].kind;
                    readDevice(node, object);
                    return;
                }
            }
        }
    }

    void readDevice(pugi::xml_node node, Object& object) {
        pugi::xml_node next;
        switch (object.deviceKind) {
        case DeviceKind::Cmyk:
            object.deviceSound = numbers(node, m_inkNames, object.device, next);
            if (object.deviceSound && m_document.child(node, m_spotColor)) {
                object.inks = node;
            }
            break;
        case DeviceKind::Rgb: {
            double range = 255;
            const pugi::xml_node stated = m_document.child(node, m_maxRange);
            object.deviceSound = numbers(node, m_rgbNames, object.device, next) &&
                                 (!stated || numberOf(stated, range)) && range > 0;
            for (double& value : object.device) {
                value = value * 100 / range;
            }
            break;
        }
        case DeviceKind::Custom:
            object.deviceSound = true;
            object.inks = node;
            break;
        case DeviceKind::None:
            break;
        }
    }

    void takeValues(pugi::xml_node values, std::string_view objectType) {
        for (pugi::xml_node node = values.first_child(); node; node = node.next_sibling()) {
            for (std::size_t i = 0; i < std::size(valueNames); ++i) {
                if (m_document.is(node, m_valueNames[i])) {
                    addValue(valueNames[i].kind, node, objectType);
                    break;
                }
            }
        }
    }

    void addValue(Value::Kind kind, pugi::xml_node node, std::string_view objectType) {
        Value& value = m_content.values.emplace_back();
        value.kind = kind;
        pugi::xml_node next;
        if (kind == Value::Spectrum) {
            value.spectrum = node;
            value.sound = true;
        } else {
            value.sound = numbers(node, m_partNames[kind - 1U], value.numbers, next);
        }
        value.colorSpecification = specificationNamed(node.attribute("ColorSpecification").value());
        if (value.colorSpecification != nullptr) {
            value.condition = value.colorSpecification->condition;
        }
        if (value.condition == unstated) {
            value.condition = conditionIn(objectType);
        }
    }

    const Document& m_document;
    const Name m_colorValues = m_document.name("ColorValues");
    const Name m_deviceColorValues = m_document.name("DeviceColorValues");
    const Name m_tagCollection = m_document.name("TagCollection");
    const Name m_spotColor = m_document.name("SpotColor");
    const Name m_maxRange = m_document.name("MaxRange");
    const std::array<Name, 4> m_inkNames = {m_document.name("Cyan"), m_document.name("Magenta"),
                                            m_document.name("Yellow"), m_document.name("Black")};
    const std::array<Name, 3> m_rgbNames = named("R", "G", "B");
    const std::array<Name, 3> m_partNames[3] = {
        named("L", "A", "B"), named("L", "C", "H"),
        named("X", "Y", "Z")}; ///< By Value::Kind, starting with Lab.
    std::array<Name, std::size(valueNames)> m_valueNames;
    std::array<Name, std::size(deviceNames)> m_deviceNames;
    cgats::NumberReader m_numbers{cgats::blanksSeparate};
    std::string m_storage;
    Content m_content;
    std::string_view m_lastId = "\xFF"; // No attribute consists of this byte.
    const ColorSpecification* m_last = nullptr;
};

} // namespace

Content contentOf(const Document& document) {
    return Reader(document).read();
}

Place placeOf(const Document& document, const Object& object) {
    Place place;
    std::array<std::string_view, 3> position;
    document.forEach(object.location, "Tag", [&](pugi::xml_node tag) {
        const std::string_view name = tag.attribute("Name").value();
        const std::string_view value = tag.attribute("Value").value();
        if (name == "Page") {
            position[0] = value;
        } else if (name == "Row") {
            position[1] = value;
        } else if (name == "Column") {
            position[2] = value;
        } else if (name == "SampleID" && value != "-1") {
            place.sampleId = value;
        } else if (name == "SampleName") {
            place.sampleName = value;
        }
    });
    if (!position[1].empty() && !position[2].empty()) {
        for (const std::string_view part : position) {
            place.position.append(part).append("/");
        }
    }
    return place;
}

} // namespace colour::cxf
