// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/ElementsJson.h"

#include <algorithm>
#include <array>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <limits>
#include <optional>
#include <type_traits>
#include <utility>

#include "companions/tintgate-store/Failure.h"

namespace admin {

namespace {

constexpr std::array<const char*, 10> words = {"",       "pointer", "int",   "double", "string",
                                               "binary", "",        "int64", "uint",   "uint64"};

/// Integers up to here are exact in every JSON reader.
constexpr std::int64_t largestExact = std::int64_t{1} << 53;

constexpr std::uint64_t plainNan = 0x7FF8000000000000;

constexpr const char* wayToNan = "NaN:";
constexpr std::size_t nanDigits = 16;

[[noreturn]] void refuse(const Json& json, PARAM_TYPE type) {
    std::string text = json.dump(-1, ' ', true, Json::error_handler_t::replace);
    if (text.size() > 60) {
        text = text.substr(0, 60) + "...";
    }
    throw Failure(Status::BadInput, text + " is not of type " + typeWord(type));
}

template<class T>
std::optional<T> numberFromText(std::string_view text) {
    T number{};
    const char* const end = text.data() + text.size();
    const auto [stopped, error] = std::from_chars(text.data(), end, number);
    if (text.empty() || error != std::errc() || stopped != end) {
        return std::nullopt;
    }
    return number;
}

std::optional<double> nanFromText(const std::string& text) {
    const std::string digits = text.substr(std::string(wayToNan).size());
    std::uint64_t bits = 0;
    const char* const end = digits.data() + digits.size();
    const auto [stopped, error] = std::from_chars(digits.data(), end, bits, 16);
    const auto number = std::bit_cast<double>(bits);
    if (digits.size() != nanDigits || error != std::errc() || stopped != end ||
        !std::isnan(number)) {
        return std::nullopt;
    }
    return number;
}

std::optional<double> doubleFromWord(const std::string& text) {
    if (text == "NaN") {
        return std::bit_cast<double>(plainNan);
    }
    if (text == "Infinity" || text == "-Infinity") {
        const double infinity = std::numeric_limits<double>::infinity();
        return text[0] == '-' ? -infinity : infinity;
    }
    return text.rfind(wayToNan, 0) == 0 ? nanFromText(text) : std::nullopt;
}

/// Empty for finite numbers.
std::string wordOfDouble(double number) {
    if (std::isinf(number)) {
        return number < 0 ? "-Infinity" : "Infinity";
    }
    if (!std::isnan(number)) {
        return {};
    }
    const auto bits = std::bit_cast<std::uint64_t>(number);
    if (bits == plainNan) {
        return "NaN";
    }
    char text[nanDigits + 1];
    std::snprintf(text, sizeof text, "%016llx", static_cast<unsigned long long>(bits));
    return wayToNan + std::string(text);
}

/// The number in its own type. `quoted` permits its digits in a string.
template<class T>
T wholeFromJson(const Json& json, PARAM_TYPE type, bool quoted) {
    std::optional<T> number;
    if (json.is_number_unsigned() && std::in_range<T>(json.get<std::uint64_t>())) {
        number = static_cast<T>(json.get<std::uint64_t>());
    } else if (json.is_number_integer() && !json.is_number_unsigned() &&
               std::in_range<T>(json.get<std::int64_t>())) {
        number = static_cast<T>(json.get<std::int64_t>());
    } else if (json.is_string() && quoted) {
        number = numberFromText<T>(json.get_ref<const std::string&>());
    }
    if (!number) {
        refuse(json, type);
    }
    return *number;
}

double doubleFromJson(const Json& json) {
    const auto number = json.is_number()   ? json.get<double>()
                        : json.is_string() ? doubleFromWord(json.get_ref<const std::string&>())
                                           : std::nullopt;
    if (!number) {
        refuse(json, PARAM_DOUBLE);
    }
    return *number;
}

/// The bytes of a "base64" member, or nothing.
std::optional<std::string> bytesFromJson(const Json& json) {
    return json.is_string() ? fromBase64(json.get_ref<const std::string&>()) : std::nullopt;
}

store::Value textValue(std::string bytes) {
    if (bytes.find('\0') != std::string::npos) {
        throw Failure(Status::BadInput, "a string can't contain a zero byte; a binary can");
    }
    return store::Text{std::make_shared<store::Bytes>(std::move(bytes))};
}

store::Value binaryValue(std::string bytes) {
    return store::Binary{std::make_shared<store::Bytes>(std::move(bytes))};
}

store::Value stringFromJson(const Json& json) {
    if (json.is_string()) {
        return textValue(json.get<std::string>());
    }
    auto bytes = json.is_object() && json.size() == 1 && json.contains("base64")
                     ? bytesFromJson(json["base64"])
                     : std::nullopt;
    if (!bytes) {
        refuse(json, PARAM_STRING);
    }
    return textValue(std::move(*bytes));
}

void* pointerFrom(std::uint64_t number) {
    return reinterpret_cast<void*>(number);
}

template<class T>
Json wholeJson(T number) {
    const bool exact =
        std::cmp_less_equal(number, largestExact) && std::cmp_greater_equal(number, -largestExact);
    return exact ? Json(number) : Json(std::to_string(number));
}

class JsonOfValue {
  public:
    Json operator()(store::Hole) const { return nullptr; }
    Json operator()(store::NeverKept) const { return nullptr; }
    Json operator()(void* value) const { return wholeJson(reinterpret_cast<std::uint64_t>(value)); }
    Json operator()(double value) const {
        const std::string word = wordOfDouble(value);
        return word.empty() ? Json(value) : Json(word);
    }
    Json operator()(const store::Text& value) const { return textOrBytes(value.bytes->text); }
    Json operator()(const store::Binary& value) const { return toBase64(value.bytes->text); }
    template<class T>
    Json operator()(T number) const {
        return wholeJson(number);
    }
};

/// The run's type and values. Any other member is refused.
std::pair<PARAM_TYPE, const Json*> typeAndValues(const Json& run) {
    PARAM_TYPE type = PARAM_DELETE;
    const Json* values = nullptr;
    for (const auto& [name, member] : run.items()) {
        if (name == "at") {
            continue;
        }
        if (values != nullptr || typeOfWord(name) == PARAM_DELETE) {
            throw Failure(Status::BadInput, "\"" + name + "\" is not a type, or a second one");
        }
        type = typeOfWord(name);
        values = &member;
    }
    if (values == nullptr || (values->is_array() && values->empty())) {
        throw Failure(Status::BadInput, "there is no value");
    }
    return {type, values};
}

/// The start of the run: the next position or a later one.
std::int64_t startOf(const Json& run, std::int64_t next) {
    if (!run.contains("at")) {
        return next;
    }
    const Json& at = run["at"];
    if (!at.is_number_integer() || at.get<std::int64_t>() < next ||
        at.get<std::int64_t>() > store::highestPosition) {
        throw Failure(Status::BadInput,
                      "\"at\" is " + at.dump(-1, ' ', true) + ", but must be a position from " +
                          std::to_string(next) + " to " + std::to_string(store::highestPosition));
    }
    return at.get<std::int64_t>();
}

/// Stores a run's elements. Returns the position after them.
std::int64_t putRun(const Json& run, std::int64_t next, store::Elements& elements) {
    if (!run.is_object()) {
        throw Failure(Status::BadInput, "elements must be {\"TYPE\": VALUE} or a list of these");
    }
    const auto [type, values] = typeAndValues(run);
    std::int64_t position = startOf(run, next);
    const auto put = [&, type = type](const Json& value) {
        if (position > store::highestPosition) {
            throw Failure(Status::BadInput, "there are more elements than a key can have");
        }
        elements.put(static_cast<int>(position++), valueFromJson(type, value));
    };
    if (values->is_array()) {
        std::for_each(values->begin(), values->end(), put);
    } else {
        put(*values);
    }
    return position;
}

} // namespace

const char* typeWord(PARAM_TYPE type) {
    const auto index = static_cast<std::size_t>(type);
    return index < words.size() ? words[index] : "";
}

PARAM_TYPE typeOfWord(const std::string& word) {
    const auto found = word.empty() ? words.end() : std::find(words.begin(), words.end(), word);
    return found == words.end() ? PARAM_DELETE : static_cast<PARAM_TYPE>(found - words.begin());
}

Json valueJson(const store::Value& value) {
    return std::visit(JsonOfValue(), value);
}

store::Value valueFromJson(PARAM_TYPE type, const Json& json) {
    switch (type) {
    case PARAM_POINTER:
        return pointerFrom(wholeFromJson<std::uint64_t>(json, type, true));
    case PARAM_INT:
        return wholeFromJson<int>(json, type, false);
    case PARAM_UINT:
        return wholeFromJson<unsigned int>(json, type, false);
    case PARAM_INT64:
        return wholeFromJson<long long>(json, type, true);
    case PARAM_UINT64:
        return wholeFromJson<unsigned long long>(json, type, true);
    case PARAM_DOUBLE:
        return doubleFromJson(json);
    case PARAM_STRING:
        return stringFromJson(json);
    case PARAM_BINARY:
        if (auto bytes = bytesFromJson(json)) {
            return binaryValue(std::move(*bytes));
        }
        refuse(json, type);
    default:
        throw Failure(Status::BadInput, "this is not a type");
    }
}

store::Value valueFromText(PARAM_TYPE type, const std::string& text) {
    if (type == PARAM_STRING) {
        return textValue(text);
    }
    if (type == PARAM_BINARY || (type == PARAM_DOUBLE && doubleFromWord(text))) {
        return valueFromJson(type, text);
    }
    if (type == PARAM_DOUBLE) {
        const auto number = numberFromText<double>(text);
        if (!number || !std::isfinite(*number)) {
            refuse(text, type);
        }
        return *number;
    }
    if (const auto number = numberFromText<std::int64_t>(text)) {
        return valueFromJson(type, *number);
    }
    return valueFromJson(type, text);
}

std::string valueText(const store::Value& value) {
    if (const auto* text = std::get_if<store::Text>(&value)) {
        return text->bytes->text;
    }
    if (const auto* binary = std::get_if<store::Binary>(&value)) {
        return binary->bytes->text;
    }
    const Json json = valueJson(value);
    return json.is_string() ? json.get<std::string>() : json.dump();
}

Json elementsJson(const store::Elements& elements) {
    Json runs = Json::array();
    PARAM_TYPE type = PARAM_DELETE;
    int next = 0;
    elements.visit([&](int position, const store::Value& value) {
        if (position != next || type != store::typeOf(value)) {
            type = store::typeOf(value);
            runs.push_back(position == next ? Json::object() : Json{{"at", position}});
            runs.back()[typeWord(type)] = Json::array();
        }
        runs.back()[typeWord(type)].push_back(valueJson(value));
        next = position + 1;
        return true;
    });
    for (auto& run : runs) {
        for (auto& [name, values] : run.items()) {
            if (values.is_array() && values.size() == 1) {
                values = Json(values[0]);
            }
        }
    }
    return runs.size() == 1 ? Json(runs[0]) : runs;
}

std::shared_ptr<store::Elements> elementsFromJson(const Json& json) {
    auto elements = std::make_shared<store::Elements>();
    if (!json.is_array()) {
        putRun(json, 0, *elements);
        return elements;
    }
    if (json.empty()) {
        throw Failure(Status::BadInput, "there is no element");
    }
    std::int64_t next = 0;
    for (const auto& run : json) {
        next = putRun(run, next, *elements);
    }
    return elements;
}

} // namespace admin
