// SPDX-License-Identifier: Apache-2.0
// An ICC profile for CMYK, evaluated absolute colorimetric (D50, 2 degrees).
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "colour/DataSet.h"
#include "colour/Failure.h"

namespace colour {

/// True if the bytes carry the signature of an ICC profile.
bool looksLikeProfile(std::string_view bytes);

/// Owns the profile and its transform. Movable. Threads may evaluate one profile at once: the
/// transform keeps nothing between calls.
class Profile {
  public:
    Profile();
    ~Profile();
    Profile(Profile&&) noexcept;
    Profile& operator=(Profile&&) noexcept;

    /// Opens a v2 or v4 profile from memory; the bytes may go afterwards. On failure the profile
    /// that was open stays.
    Failure open(std::string_view bytes);

    /// Lab of `count` patches of C, M, Y, K in percent, `stride` values apart. Amounts beyond 0 to
    /// 100 are cut. ProfileUnusable, with `lab` in part written, where a damaged profile gives no
    /// colours.
    /// REQUIRES: open gave None.
    Failure evaluate(const double* cmyk, std::size_t count, std::size_t stride, Lab* lab) const;

    /// The profile's own description, UTF-8; empty where it has none.
    const std::string& description() const;

  private:
    struct State;
    std::unique_ptr<State> m_state;
};

} // namespace colour
