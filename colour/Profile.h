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

/// True if the bytes have the signature of an ICC profile.
bool looksLikeProfile(std::string_view bytes);

/// Owns the profile and its transform. Movable. Threads may evaluate one profile at once: the
/// transform keeps nothing between calls.
class Profile {
  public:
    Profile();
    ~Profile();
    Profile(Profile&&) noexcept;
    Profile& operator=(Profile&&) noexcept;

    /// Opens a v2 or v4 profile from memory; the bytes are not needed afterwards. On failure, keeps
    /// the profile that was open.
    Failure open(std::string_view bytes);

    /// Lab of `count` patches of C, M, Y, K in percent, `stride` values apart. Amounts are clamped
    /// to 0 to 100. ProfileUnusable, with `lab` partly written, if a damaged profile yields no
    /// colours. REQUIRES: open returned None.
    Failure evaluate(const double* cmyk, std::size_t count, std::size_t stride, Lab* lab) const;

    /// The profile's own description in UTF-8; empty if it has none.
    const std::string& description() const;

  private:
    struct State;
    std::unique_ptr<State> m_state;
};

} // namespace colour
