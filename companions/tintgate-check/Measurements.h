// SPDX-License-Identifier: Apache-2.0
// The measurements that the arguments mean, one after the other.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace check {

struct Measurement {
    std::string path;     ///< As given, or found below a folder that was given.
    std::string relative; ///< Where it is below that folder; outputs below --out repeat it.
    bool inFolder = false;
    bool isSecond = false; ///< An earlier one of this run has the same outputs.
};

/// Whether a file that is met in a folder counts as a measurement: by the ending of its name, and
/// hidden ones never do.
bool looksLikeMeasurement(std::string_view fileName);

/// The endings that count, for people.
std::string measurementEndings();

/// Where the outputs of a file that was named go below --out: its path as it was written, or its
/// name alone if that path leads elsewhere (it is absolute or has "..").
std::string relativeOf(const std::string& path);

/// Walks over arguments in their order, and over folders by name. Keeps the names of one folder at
/// a time and of those above it, so that a large tree takes little memory. Links to folders are not
/// followed.
class MeasurementWalk {
  public:
    explicit MeasurementWalk(std::vector<std::string> arguments);

    /// The next one, or nothing at the end. A folder that can't be read or has no measurement at
    /// all comes as a measurement of its own path, which nothing can read.
    std::optional<Measurement> next();

    /// How many there are, if that is known without walking.
    std::optional<std::size_t> total() const { return m_total; }

  private:
    struct Level {
        std::string folder;
        std::vector<std::string> names; ///< The last one is next.
    };

    bool enter(const std::string& folder);

    std::vector<std::string> m_arguments; ///< The last one is next.
    std::optional<std::size_t> m_total;
    std::vector<Level> m_levels;
    std::string m_root; ///< The argument that is being walked over.
    bool m_anyBelowRoot = false;
};

} // namespace check
