#include "colour/CxfObjects.h"

#include <array>
#include <charconv>

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

/// "M1" of M1_Daylight, M1_Measurement and the like; empty for any other text.
std::string_view conditionIn(std::string_view text) {
    const bool stated =
        text.size() > 2 && text[0] == 'M' && text[1] >= '0' && text[1] <= '3' && text[2] == '_';
    return stated ? text.substr(0, 2) : std::string_view();
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
    explicit Reader(const Document& document) : m_document(document) {}

    Content read() {
        const pugi::xml_node resources = m_document.child(m_document.root(), "Resources");
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
    std::string text(pugi::xml_node parent, std::string_view name) const {
        std::string storage;
        return std::string(textOf(m_document.child(parent, name), storage));
    }

    Specification specificationOf(pugi::xml_node node) const {
        Specification specification;
        const pugi::xml_node tristimulus = m_document.child(node, "TristimulusSpec");
        specification.conditions.illuminant = text(tristimulus, "Illuminant");
        const std::string observer = text(tristimulus, "Observer");
        specification.conditions.observer = observer == "2_Degree"    ? "2"
                                            : observer == "10_Degree" ? "10"
                                                                      : "";
        const pugi::xml_node measurement = m_document.child(node, "MeasurementSpec");
        const pugi::xml_node range = m_document.child(measurement, "WavelengthRange");
        specification.firstWavelength = wholeNumber(range.attribute("StartWL").value());
        specification.increment = wholeNumber(range.attribute("Increment").value());
        const pugi::xml_node device = m_document.child(measurement, "Device");
        specification.conditions.measurement = measuredUnder(device);
        for (const char* part : {"Manufacturer", "Model", "SerialNumber"}) {
            const std::string word = text(device, part);
            if (!word.empty()) {
                specification.instrument += (specification.instrument.empty() ? "" : " ") + word;
            }
        }
        return specification;
    }

    /// The illumination first: a filter for M2 or a polariser is mentioned beside it, too.
    std::string measuredUnder(pugi::xml_node device) const {
        const std::string illumination = text(device, "DeviceIllumination");
        if (const std::string_view condition = conditionIn(illumination); !condition.empty()) {
            return std::string(condition);
        }
        const std::string polarised = text(device, "DevicePolarization");
        if (polarised == "true" || polarised == "1") {
            return "M3";
        }
        return text(device, "DeviceFilter") == "Filter_UVExcluded" ? "M2" : "";
    }

    const Specification* specificationNamed(const char* id) {
        // Nearly always that of the object before.
        if (m_lastId != id) {
            const auto found = m_content.specifications.find(id);
            m_last = found != m_content.specifications.end() ? &found->second : nullptr;
            m_lastId = id;
        }
        return m_last;
    }

    void addObject(pugi::xml_node node) {
        Object object;
        object.node = node;
        object.id = node.attribute("Id").value();
        object.name = node.attribute("Name").value();
        object.firstValue = m_content.values.size();
        for (pugi::xml_node part = node.first_child(); part; part = part.next_sibling()) {
            if (m_document.is(part, "DeviceColorValues")) {
                takeDevice(part, object);
            } else if (m_document.is(part, "ColorValues")) {
                takeValues(part, node.attribute("ObjectType").value());
            } else if (m_document.is(part, "TagCollection")) {
                takeTags(part, object);
            }
        }
        object.valueCount = m_content.values.size() - object.firstValue;
        if (object.hasDevice() || object.hasColour()) {
            m_content.objects.push_back(std::move(object));
        }
    }

    void takeDevice(pugi::xml_node values, Object& object) {
        for (pugi::xml_node node = values.first_child(); node; node = node.next_sibling()) {
            for (const auto& [name, kind] : deviceNames) {
                if (!object.hasDevice() && m_document.is(node, name)) {
                    object.device = node;
                    object.deviceKind = kind;
                }
            }
        }
    }

    void takeValues(pugi::xml_node values, std::string_view objectType) {
        for (pugi::xml_node node = values.first_child(); node; node = node.next_sibling()) {
            for (const auto& [name, kind] : valueNames) {
                if (!m_document.is(node, name)) {
                    continue;
                }
                Value value{kind,
                            node,
                            specificationNamed(node.attribute("ColorSpecification").value()),
                            {}};
                if (value.specification != nullptr) {
                    value.condition = value.specification->conditions.measurement;
                }
                if (value.condition.empty()) {
                    value.condition = conditionIn(objectType);
                }
                m_content.values.push_back(value);
                break;
            }
        }
    }

    void takeTags(pugi::xml_node collection, Object& object) {
        if (std::string_view(collection.attribute("Name").value()) != "Location") {
            return;
        }
        std::array<std::string_view, 3> place;
        m_document.forEach(collection, "Tag", [&](pugi::xml_node tag) {
            const std::string_view name = tag.attribute("Name").value();
            const std::string_view value = tag.attribute("Value").value();
            if (name == "Page") {
                place[0] = value;
            } else if (name == "Row") {
                place[1] = value;
            } else if (name == "Column") {
                place[2] = value;
            } else if (name == "SampleID" && value != "-1") {
                object.sampleId = value;
            } else if (name == "SampleName") {
                object.sampleName = value;
            }
        });
        if (!place[1].empty() && !place[2].empty()) {
            for (const std::string_view part : place) {
                object.location.append(part).append("/");
            }
        }
    }

    const Document& m_document;
    Content m_content;
    std::string_view m_lastId = "\xFF"; // No attribute has this byte alone.
    const Specification* m_last = nullptr;
};

} // namespace

Content contentOf(const Document& document) {
    return Reader(document).read();
}

} // namespace colour::cxf
