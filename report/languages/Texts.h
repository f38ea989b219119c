// SPDX-License-Identifier: Apache-2.0
// Texts for people, in their language.
//
// The texts are in tables, one for each language: en.json and its siblings beside this file. A new
// text goes into all of them; until then, the test LanguageTables fails and the text is English.
//
//   const Texts say(Language::German);
//   say("verdict.passed")                                  Bestanden
//   say("count.patches", {{"count", patches}})             1.617 Messfelder
//   say("page.nearest", {{"criterion", title}, {"value", say.number(2.5, 2)}})
//
// A script on a page gets the texts below "script." (Texts::forScript) and has the same lookup.
#pragma once

#include <algorithm>
#include <concepts>
#include <cstddef>
#include <initializer_list>
#include <iterator>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "TextKeys.h"
#include "report/languages/Language.h"

namespace languages {

/// A key of the tables. A key that en.json does not have does not compile.
class Key {
  public:
    // NOLINTNEXTLINE(google-explicit-constructor): keys are written as plain texts.
    consteval Key(const char* name)
        : m_index(static_cast<std::size_t>(
              std::lower_bound(std::begin(textKeys), std::end(textKeys), std::string_view(name)) -
              std::begin(textKeys))) {
        if (m_index == std::size(textKeys) || textKeys[m_index] != name) {
            throw "en.json has no such text";
        }
    }

    constexpr std::size_t index() const { return m_index; }

  private:
    std::size_t m_index;
};

/// What a placeholder is replaced with: text as it is, a count as Texts::count writes it.
struct Value {
    Value(std::string_view placeholder, std::string_view value) : name(placeholder), text(value) {}
    Value(std::string_view placeholder, std::unsigned_integral auto value)
        : name(placeholder), count(value) {}

    std::string_view name;
    std::string_view text;
    std::optional<std::size_t> count; ///< Then `text` is empty.
};

/// An English sentence, taken apart: which text it was made from, and what with.
struct Recognised {
    std::size_t index = 0;                                   ///< Into textKeys.
    std::vector<std::pair<std::string, std::string>> values; ///< Placeholders with their texts.
};

/// Finds the text below `prefix` that the sentence was made from. Results hold such sentences, with
/// numbers and names in them. Nothing if no text fits.
std::optional<Recognised> recognise(std::string_view english, std::string_view prefix);

class Texts {
  public:
    explicit Texts(Language language);

    Language language() const { return m_language; }

    /// The text with its placeholders replaced. A placeholder without a value stays as it is, and a
    /// value without its placeholder is ignored. The count named "count" selects between the forms
    /// for one and for many.
    std::string operator()(Key key, std::initializer_list<Value> values = {}) const;

    std::string operator()(Key key, const std::vector<Value>& values) const;

    /// The same for a key that is known only when the program runs. Nothing if it is not in the
    /// tables.
    std::optional<std::string> find(std::string_view key,
                                    std::initializer_list<Value> values = {}) const;

    /// Fixed decimals. From 10,000 on, thousands are grouped. An en dash if the value is not
    /// finite.
    std::string number(double value, int decimals) const;

    /// The same for a text of digits with a decimal point, such as "-12345.50".
    std::string number(std::string_view digits) const;

    std::string count(std::size_t value) const;

    /// "1 May 2024"; the month is 1 to 12.
    std::string day(int day, int month, int year) const;

    /// "1 May 2024, 12:34"
    std::string time(const std::string& day, const std::string& clock) const;

    /// "cyan, magenta and black"
    std::string list(const std::vector<std::string>& items) const;

    /// The text of a sentence that was recognised, with its values.
    std::string operator()(const Recognised& sentence) const;

    /// The texts that a page's script needs, as a JSON object of ASCII by key without "script.":
    /// those below "script.common.", and those below "script." `page` ".". A text is a string, or a
    /// list of the form for one and that for all other counts.
    std::string forScript(std::string_view page) const;

  private:
    std::string filled(std::size_t index, const std::vector<Value>& values) const;

    Language m_language;
};

/// For programs and files that stay English.
const Texts& english();

} // namespace languages
