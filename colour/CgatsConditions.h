// SPDX-License-Identifier: Apache-2.0
// Illuminant, observer and measurement condition from what a header says of them.
#pragma once

#include <string>
#include <string_view>

#include "colour/DataSet.h"

namespace colour::cgats {

/// Gathers statements. The plainest kind of statement counts, in the order of Rank. Statements of
/// one kind that differ cancel out.
class ConditionFinder {
  public:
    /// `keyword` in capitals, `value` UTF-8.
    void see(std::string_view keyword, std::string_view value);

    Conditions result() const;

  private:
    enum Rank {
        Keyword,  ///< A keyword of its own, such as MEASUREMENT_CONDITION.
        Named,    ///< A named part of a text, such as MeasurementCondition=M1.
        Filter,   ///< A filter that is in the way of the light.
        Geometry, ///< A word in MEASUREMENT_GEOMETRY.
        Prose,    ///< A word in a text about the instrument.
        Hint,     ///< No filter at all, or a lamp: M0 in practice.
        None
    };
    struct Statement {
        Rank rank = None;
        std::string value;
        bool contradicted = false;
        void add(Rank newRank, const std::string& newValue);
        std::string result() const { return contradicted ? std::string() : value; }
    };

    void seeProse(Rank rank, std::string_view text);
    void seeNamed(std::string_view name, std::string_view value);
    void seeFilter(std::string_view text);

    Statement m_illuminant;
    Statement m_observer;
    Statement m_measurement;
};

} // namespace colour::cgats
