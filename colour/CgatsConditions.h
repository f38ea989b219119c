// Illuminant, observer and measurement condition from what a header says of them.
#pragma once

#include <string>
#include <string_view>

#include "colour/DataSet.h"

namespace colour::cgats {

/// Gathers statements. The plainest kind of statement counts: a keyword of its own before a text
/// about the instrument, that before a filter. Statements of one kind that differ cancel out.
class ConditionFinder {
  public:
    /// `keyword` in capitals, `value` UTF-8.
    void see(std::string_view keyword, std::string_view value);

    Conditions result() const;

  private:
    enum Rank { Keyword, Prose, Filter, None };
    struct Statement {
        Rank rank = None;
        std::string value;
        bool contradicted = false;
        void add(Rank newRank, const std::string& newValue);
        std::string result() const { return contradicted ? std::string() : value; }
    };

    void seeProse(Rank rank, std::string_view text);
    void seeFilter(std::string_view text);

    Statement m_illuminant;
    Statement m_observer;
    Statement m_measurement;
};

} // namespace colour::cgats
