// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/TicketKeys.h"

#include <cstring>
#include <limits>

namespace report {

std::optional<int> integerOf(const SharedElements& elements) {
    const auto* value = elements ? elements->first() : nullptr;
    const auto* number = value != nullptr ? std::get_if<int>(value) : nullptr;
    return number != nullptr ? std::optional(*number) : std::nullopt;
}

std::string textOf(const SharedElements& elements) {
    const auto* value = elements ? elements->first() : nullptr;
    const auto* bytes = value != nullptr ? std::get_if<store::Text>(value) : nullptr;
    return bytes != nullptr ? bytes->bytes->text : std::string();
}

std::vector<double> doublesOf(const SharedElements& elements) {
    if (!elements || static_cast<std::size_t>(elements->count()) > mostElements) {
        return {};
    }
    std::vector<double> values(static_cast<std::size_t>(elements->count()),
                               std::numeric_limits<double>::quiet_NaN());
    if (elements->numberType() == PARAM_DOUBLE) {
        std::memcpy(values.data(), elements->numbers().data(), values.size() * sizeof(double));
        return values;
    }
    elements->visit([&](int position, const store::Value& value) {
        if (const auto* number = std::get_if<double>(&value)) {
            values[static_cast<std::size_t>(position)] = *number;
        }
        return true;
    });
    return values;
}

std::vector<int> integersOf(const SharedElements& elements) {
    std::vector<int> values;
    if (elements) {
        elements->visit([&](int position, const store::Value& value) {
            const auto* number = std::get_if<int>(&value);
            if (number == nullptr || position != static_cast<int>(values.size())) {
                return false;
            }
            values.push_back(*number);
            return true;
        });
    }
    return values;
}

} // namespace report
