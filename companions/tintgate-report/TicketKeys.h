// What a job's ticket holds under its keys.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "store/tickets/TicketElements.h"

namespace reporting {

using SharedElements = std::shared_ptr<const store::Elements>;

/// The first element, as a reader of the key gets it; nothing, or an empty text, where there is
/// none of that type.
std::optional<int> integerOf(const SharedElements& elements);
std::string textOf(const SharedElements& elements);

/// All elements. Holes, and elements that are no doubles, are NaN; there are none at all of an
/// array that is longer than a million patches need.
std::vector<double> doublesOf(const SharedElements& elements);
inline constexpr std::size_t mostElements = std::size_t{1} << 20;

/// The elements up to the first hole or other type.
std::vector<int> integersOf(const SharedElements& elements);

/// A job's keys as one of its strips has them.
class StripKeys {
  public:
    explicit StripKeys(int strip) : m_suffix(strip == 2 ? "2" : "") {}

    std::string measured(const std::string& name) const {
        return "Remote/Measurement" + m_suffix + "/" + name;
    }
    std::string own(const std::string& key) const { return key + m_suffix; }

  private:
    std::string m_suffix;
};

} // namespace reporting
