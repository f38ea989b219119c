// SPDX-License-Identifier: Apache-2.0
// The objects of a CxF3 file: their values and their measurement conditions.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "colour/CxfXml.h"
#include "colour/DataSet.h"

namespace colour::cxf {

/// Number of a measurement condition of ISO 13655, 0 to 3, or this.
inline constexpr std::int8_t unstated = -1;

/// A ColorSpecification.
struct ColorSpecification {
    Conditions conditions; ///< Only illuminant and observer.
    std::int8_t condition = unstated;
    std::optional<int> firstWavelength;
    std::optional<int> increment;
    std::string instrument; ///< Maker, model and serial number.
};

/// One element of an object's ColorValues.
struct Value {
    enum Kind : std::uint8_t { Spectrum, Lab, LCh, Xyz };
    Kind kind = Lab;
    bool sound = false; ///< All numbers are present and valid; a spectrum's text is not checked.
    double numbers[3] = {};  ///< In the order of the kind's name.
    pugi::xml_node spectrum; ///< Only for a Spectrum.
    const ColorSpecification* colorSpecification =
        nullptr;                      ///< Null if it refers to none, or to a missing one.
    std::int8_t condition = unstated; ///< May come from the object's type.
};

/// The kind of an object's DeviceColorValues.
enum class DeviceKind : std::uint8_t { None, Cmyk, Rgb, Custom };

struct Object {
    std::string_view id;
    std::string_view name;
    std::size_t firstValue = 0; ///< Index in Content::values.
    std::uint32_t valueCount = 0;
    DeviceKind deviceKind = DeviceKind::None;
    bool deviceSound = false; ///< The numbers of `device` are present and valid.
    double device[4] = {};    ///< C, M, Y, K in percent, or R, G, B in percent of their range.
    pugi::xml_node inks;      ///< The element with spot colours; null if there are none.
    pugi::xml_node location;  ///< The tags of the place on the sheet; may be null.

    bool hasDevice() const { return deviceKind != DeviceKind::None; }
    bool hasColour() const { return valueCount > 0; }
};

/// The tags of an object's place. Views point into the document.
struct Place {
    std::string position; ///< "page/row/column/"; empty if not stated.
    std::string_view sampleId;
    std::string_view sampleName;
};
Place placeOf(const Document& document, const Object& object);

/// All objects of a file, in its order. Views and nodes point into the document.
struct Content {
    std::unordered_map<std::string_view, ColorSpecification> specifications;
    std::vector<Object> objects; ///< Only objects with device values or known colours.
    std::vector<Value> values;
};

Content contentOf(const Document& document);

} // namespace colour::cxf
