// SPDX-License-Identifier: Apache-2.0
#include "report/languages/Texts.h"

#include <charconv>
#include <cmath>

#include <nlohmann/json.hpp>

#include "report/languages/Tables.h"

namespace languages {
namespace {

constexpr std::size_t fewestGrouped = 5; ///< Digits: years and patches of a chart stay whole.

std::size_t indexOf(std::string_view key) {
    return static_cast<std::size_t>(
        std::lower_bound(std::begin(textKeys), std::end(textKeys), key) - std::begin(textKeys));
}

const Forms& formsOf(Language language, std::size_t index) {
    return tables[static_cast<std::size_t>(language)][index];
}

/// French counts nothing as one. Tables without forms have the same text twice.
bool isOne(Language language, std::string_view digits) {
    return digits == "1" || (language == Language::French && digits == "0");
}

/// Calls `literal` and `placeholder` for each piece of a text in turn.
template<class Literal, class Placeholder>
void takeApart(std::string_view text, Literal literal, Placeholder placeholder) {
    while (!text.empty()) {
        const std::size_t open = text.find('{');
        const std::size_t close = open == text.npos ? text.npos : text.find('}', open);
        if (close == text.npos) {
            literal(text);
            return;
        }
        literal(text.substr(0, open));
        placeholder(text.substr(open + 1, close - open - 1));
        text.remove_prefix(close + 1);
    }
}

/// The values that make the text equal to the sentence. Each takes as little as it can.
std::optional<Recognised> match(std::string_view sentence, std::string_view text) {
    Recognised found;
    bool fits = true;
    std::string_view waiting; // A placeholder that takes what precedes the next literal.
    takeApart(
        text,
        [&](std::string_view literal) {
            const std::size_t at = waiting.empty()
                                       ? (sentence.starts_with(literal) ? 0 : sentence.npos)
                                       : sentence.find(literal, 1);
            fits = fits && at != sentence.npos && (at == 0 || !literal.empty());
            if (!fits) {
                return;
            }
            if (!waiting.empty()) {
                found.values.emplace_back(waiting, sentence.substr(0, at));
                waiting = {};
            }
            sentence.remove_prefix(at + literal.size());
        },
        [&](std::string_view name) { waiting = name; });
    if (!waiting.empty()) {
        found.values.emplace_back(waiting, sentence);
        fits = fits && !sentence.empty();
    } else {
        fits = fits && sentence.empty();
    }
    return fits ? std::optional(found) : std::nullopt;
}

} // namespace

std::optional<Recognised> recognise(std::string_view english, std::string_view prefix) {
    for (std::size_t i = indexOf(prefix);
         i < std::size(textKeys) && textKeys[i].starts_with(prefix); ++i) {
        const Forms& forms = formsOf(Language::English, i);
        for (const std::string_view text : {forms.one, forms.other}) {
            if (auto found = match(english, text)) {
                if (text == forms.one && forms.one != forms.other) {
                    found->values.emplace_back("count", "1");
                }
                found->index = i;
                return found;
            }
        }
    }
    return std::nullopt;
}

Texts::Texts(Language language) : m_language(language) {}

std::string Texts::filled(std::size_t index, const std::vector<Value>& values) const {
    const Forms& forms = formsOf(m_language, index);
    const auto valueOf = [&](std::string_view name) {
        const auto found = std::find_if(values.begin(), values.end(),
                                        [&](const Value& value) { return value.name == name; });
        return found == values.end() ? nullptr : &*found;
    };
    const Value* const counted = valueOf("count");
    const bool one =
        counted != nullptr && isOne(m_language, counted->count ? std::to_string(*counted->count)
                                                               : std::string(counted->text));
    std::string text;
    takeApart(
        one ? forms.one : forms.other, [&](std::string_view literal) { text += literal; },
        [&](std::string_view name) {
            if (const Value* const value = valueOf(name)) {
                text += value->count ? count(*value->count) : std::string(value->text);
            } else {
                text.append("{").append(name).append("}");
            }
        });
    return text;
}

std::string Texts::operator()(Key key, std::initializer_list<Value> values) const {
    return filled(key.index(), std::vector<Value>(values));
}

std::string Texts::operator()(Key key, const std::vector<Value>& values) const {
    return filled(key.index(), values);
}

std::string Texts::operator()(const Recognised& sentence) const {
    std::vector<Value> values;
    for (const auto& [name, text] : sentence.values) {
        values.emplace_back(std::string_view(name), std::string_view(text));
    }
    return filled(sentence.index, values);
}

std::optional<std::string> Texts::find(std::string_view key,
                                       std::initializer_list<Value> values) const {
    const std::size_t index = indexOf(key);
    return index < std::size(textKeys) && textKeys[index] == key
               ? std::optional(filled(index, values))
               : std::nullopt;
}

std::string Texts::number(double value, int decimals) const {
    char text[400];
    if (!std::isfinite(value)) {
        return "\u2013";
    }
    const auto [end, error] =
        std::to_chars(text, text + sizeof text, value, std::chars_format::fixed, decimals);
    return error == std::errc() ? number(std::string_view(text, end)) : "\u2013";
}

std::string Texts::number(std::string_view digits) const {
    std::string text;
    if (digits.starts_with('-')) {
        text = "-";
        digits.remove_prefix(1);
    }
    const std::size_t point = std::min(digits.find('.'), digits.size());
    for (std::size_t i = 0; i < point; ++i) {
        if (i != 0 && (point - i) % 3 == 0 && point >= fewestGrouped) {
            text += (*this)("script.common.thousands");
        }
        text += digits[i];
    }
    if (point < digits.size()) {
        text += (*this)("script.common.decimal");
        text += digits.substr(point + 1);
    }
    return text;
}

std::string Texts::count(std::size_t value) const {
    return number(std::string_view(std::to_string(value)));
}

std::string Texts::day(int day, int month, int year) const {
    const std::string name = find("month." + std::to_string(month)).value_or(std::to_string(month));
    const std::string first = (*this)("date.first");
    return (*this)("date.day", {{"day", day == 1 && !first.empty() ? first : std::to_string(day)},
                                {"month", name},
                                {"year", std::to_string(year)}});
}

std::string Texts::time(const std::string& day, const std::string& clock) const {
    return (*this)("date.time", {{"day", day}, {"clock", clock}});
}

std::string Texts::list(const std::vector<std::string>& items) const {
    std::string text;
    for (std::size_t i = 0; i < items.size(); ++i) {
        if (i != 0) {
            text += i + 1 == items.size() ? (*this)("list.last") : (*this)("list.comma");
        }
        text += items[i];
    }
    return text;
}

std::string Texts::forScript(std::string_view page) const {
    nlohmann::ordered_json texts = nlohmann::ordered_json::object();
    constexpr std::string_view script = "script.";
    for (const std::string& prefix :
         {std::string(script) + "common.", std::string(script) + std::string(page) + "."}) {
        for (std::size_t i = indexOf(prefix);
             i < std::size(textKeys) && textKeys[i].starts_with(prefix); ++i) {
            const auto& [one, other] = formsOf(m_language, i);
            const std::string key(textKeys[i].substr(script.size()));
            if (one == other) {
                texts[key] = std::string(other);
            } else {
                texts[key] = {std::string(one), std::string(other)};
            }
        }
    }
    return texts.dump(-1, ' ', true);
}

const Texts& english() {
    static const Texts texts(Language::English);
    return texts;
}

} // namespace languages
