// SPDX-License-Identifier: Apache-2.0
#include "colour/Identity.h"

#include <array>
#include <bit>
#include <cmath>
#include <cstdint>
#include <vector>

#define XXH_INLINE_ALL
#include <xxhash.h>

namespace colour {
namespace {

/// Hashes integers in blocks.
class Digest {
  public:
    void add(double value, double scale) {
        m_block[m_used++] = rounded(value * scale);
        if (m_used == m_block.size()) {
            flush();
        }
    }

    std::string finish() {
        flush();
        XXH128_canonical_t canonical;
        XXH128_canonicalFromHash(&canonical, XXH3_128bits_digest(&m_state));
        std::string text;
        for (const unsigned char byte : canonical.digest) {
            text += "0123456789abcdef"[byte >> 4];
            text += "0123456789abcdef"[byte & 15];
        }
        return text;
    }

  private:
    /// The nearest integer (ties to even) as the bytes of a little-endian int32. Values are clamped
    /// to two billion, far beyond any colour; NaN and infinity count as 0.
    static std::uint32_t rounded(double number) {
        constexpr double most = 2'000'000'000;
        if (!(std::fabs(number) <= most)) {
            number = std::isfinite(number) ? std::copysign(most, number) : 0;
        }
        // In a double of this size the last bit has the value 1, so the addition rounds, and the
        // lower half of the bits is the integer. lround takes several times as long.
        constexpr double unit = 6'755'399'441'055'744; // 1.5 * 2^52
        const auto integer =
            static_cast<std::uint32_t>(std::bit_cast<std::uint64_t>(number + unit));
        return std::endian::native == std::endian::little ? integer : __builtin_bswap32(integer);
    }

    void flush() {
        XXH3_128bits_update(&m_state, m_block.data(), m_used * sizeof m_block[0]);
        m_used = 0;
    }

    XXH3_state_t m_state = [] {
        XXH3_state_t state;
        XXH3_128bits_reset(&state);
        return state;
    }();
    std::array<std::uint32_t, 1024> m_block;
    std::size_t m_used = 0;
};

constexpr double devicePrecision = 10'000;
constexpr double labPrecision = 1'000;

} // namespace

std::string identityOf(const DataSet& set) {
    if (!set.hasColour()) {
        return {};
    }
    const std::size_t channels = set.channels.size();
    Digest digest;
    digest.add(static_cast<double>(channels), 1);
    for (std::size_t patch = 0; patch < set.patchCount; ++patch) {
        for (std::size_t channel = 0; channel < channels; ++channel) {
            digest.add(set.device[patch * channels + channel], devicePrecision);
        }
        const Lab& lab = set.lab[patch];
        for (const double value : {lab.L, lab.a, lab.b}) {
            digest.add(value, labPrecision);
        }
    }
    return digest.finish();
}

std::string identityOf(const Profile& profile) {
    constexpr std::size_t inks = 4;
    constexpr std::size_t steps = 6;
    constexpr std::size_t patches = steps * steps * steps * steps;
    DataSet set;
    set.patchCount = patches;
    set.deviceSpace = DeviceSpace::Cmyk;
    set.channels = {"C", "M", "Y", "K"};
    for (std::size_t patch = 0; patch < patches; ++patch) {
        for (const std::size_t divisor :
             {steps * steps * steps, steps * steps, steps, std::size_t{1}}) {
            set.device.push_back(static_cast<double>(patch / divisor % steps) * 20);
        }
    }
    set.lab.resize(patches);
    if (profile.evaluate(set.device.data(), patches, inks, set.lab.data()) != Failure::None) {
        return {};
    }
    return identityOf(set);
}

std::string identityOf(const ColourFile& file) {
    return file.profile ? identityOf(*file.profile) : file.set ? identityOf(*file.set) : "";
}

} // namespace colour
