// The objects of a CxF3 file: what each one holds, under which conditions it was measured.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "colour/CxfXml.h"
#include "colour/DataSet.h"

namespace colour::cxf {

/// A ColorSpecification.
struct Specification {
    Conditions conditions;
    std::optional<int> firstWavelength;
    std::optional<int> increment;
    std::string instrument; ///< Maker, model and serial number.
};

/// One element below an object's ColorValues.
struct Value {
    enum Kind { Spectrum, Lab, LCh, Xyz };
    Kind kind = Lab;
    pugi::xml_node node;
    const Specification* specification = nullptr; ///< Null if it names none that is there.
    std::string_view condition; ///< "M0" to "M3", also by the object's type; empty if unstated.
};

/// What the values of an object's DeviceColorValues are.
enum class DeviceKind { None, Cmyk, Rgb, Custom };

struct Object {
    std::string_view id;
    std::string_view name;
    pugi::xml_node node;
    pugi::xml_node device;
    DeviceKind deviceKind = DeviceKind::None;
    std::size_t firstValue = 0; ///< Into Content::values.
    std::size_t valueCount = 0;
    std::string location; ///< "page/row/column"; empty if the object does not state it.
    std::string_view sampleId;
    std::string_view sampleName;

    bool hasDevice() const { return deviceKind != DeviceKind::None; }
    bool hasColour() const { return valueCount > 0; }
};

/// All of a file, in its order. Views and nodes point into the document.
struct Content {
    std::unordered_map<std::string_view, Specification> specifications;
    std::vector<Object> objects; ///< With device values or colours that are known; no others.
    std::vector<Value> values;
};

Content contentOf(const Document& document);

} // namespace colour::cxf
