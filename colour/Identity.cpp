// SPDX-License-Identifier: Apache-2.0
#include "colour/Identity.h"

#include <array>
#include <cmath>
#include <cstdint>
#include <vector>

#include <sha256.h>

namespace colour {
namespace {

/// Collects integers and hashes them in blocks, which costs less than one call for each.
class Digest {
  public:
    Digest() { SHA256Init(&m_context); }

    void add(double value, double scale) {
        constexpr double most = 2'000'000'000; // Within 32 bits; no colour comes near it.
        const double scaled = std::isfinite(value) ? value * scale : 0;
        const auto number = static_cast<std::uint32_t>(
            static_cast<std::int32_t>(std::lround(std::fmin(std::fmax(scaled, -most), most))));
        for (int shift = 0; shift < 32; shift += 8) {
            m_block[m_used++] = static_cast<std::uint8_t>(number >> shift);
        }
        if (m_used == m_block.size()) {
            flush();
        }
    }

    std::string finish() {
        flush();
        std::array<std::uint8_t, SHA256_DIGEST_LENGTH> bytes{};
        SHA256Final(bytes.data(), &m_context);
        std::string text;
        for (const std::uint8_t byte : bytes) {
            text += "0123456789abcdef"[byte >> 4];
            text += "0123456789abcdef"[byte & 15];
        }
        return text;
    }

  private:
    void flush() {
        SHA256Update(&m_context, m_block.data(), m_used);
        m_used = 0;
    }

    SHA2_CTX m_context;
    std::array<std::uint8_t, 4096> m_block;
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
