// SPDX-License-Identifier: Apache-2.0
// Finds illuminant, observer and measurement condition in a header.
#pragma once

#include <string>
#include <string_view>

#include "colour/DataSet.h"

namespace colour::cgats {

/// Collects statements. Only the most explicit kind counts, in the order of Rank. Different
/// statements of the same kind cancel out.
class ConditionFinder {
  public:
    /// `keyword` in upper case, `value` in UTF-8.
    void see(std::string_view keyword, std::string_view value);

    Conditions result() const;

  private:
    enum Rank {
        Keyword,  ///< A dedicated keyword, such as MEASUREMENT_CONDITION.
        Named,    ///< A named part of a text, such as MeasurementCondition=M1.
        Filter,   ///< A filter in the light path.
        Geometry, ///< A word in MEASUREMENT_GEOMETRY.
        Prose,    ///< A word in a text about the instrument.
        Hint,     ///< No filter, or a lamp: M0 in practice.
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
