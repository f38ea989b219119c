// SPDX-License-Identifier: Apache-2.0
#include "colour/Profile.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>

#include <lcms2.h>

#include "base/Utf8.h"

namespace colour {
namespace {

// ICC.1, 7.2: a header of 128 bytes. These fields are checked before the profile is opened.
constexpr std::size_t headerBytes = 128;
constexpr std::size_t classOffset = 12;
constexpr std::size_t spaceOffset = 16;
constexpr std::size_t signatureOffset = 36;

constexpr std::size_t batch = 512; ///< Patches per call of LittleCMS.

std::uint32_t wordAt(std::string_view bytes, std::size_t offset) {
    std::uint32_t word = 0;
    for (std::size_t i = 0; i < 4; ++i) {
        word = word << 8 | static_cast<unsigned char>(bytes[offset + i]);
    }
    return word;
}

/// Checks the header. A profile shorter than its stated size is truncated: LittleCMS would ignore
/// the missing tags and might use another one instead.
Failure checkHeader(std::string_view bytes) {
    if (!looksLikeProfile(bytes) || bytes.size() < headerBytes || wordAt(bytes, 0) > bytes.size()) {
        return Failure::ProfileDamaged;
    }
    switch (wordAt(bytes, classOffset)) {
    case cmsSigOutputClass:
    case cmsSigInputClass:
    case cmsSigDisplayClass:
    case cmsSigColorSpaceClass:
        break;
    default:
        return Failure::ProfileClass;
    }
    return wordAt(bytes, spaceOffset) == cmsSigCmykData ? Failure::None
                                                        : Failure::ProfileColourSpace;
}

/// Absolute colorimetry needs the media white; LittleCMS would assume D50 if it is missing.
bool hasMediaWhite(cmsHPROFILE profile) {
    const auto* white =
        static_cast<const cmsCIEXYZ*>(cmsReadTag(profile, cmsSigMediaWhitePointTag));
    return white && white->X > 0 && white->Y > 0 && white->Z > 0;
}

/// Clamps to 0 to 100; NaN counts as no ink.
double inkAmount(double percent) {
    return percent > 0 ? std::min(percent, 100.0) : 0;
}

/// False for values that only a damaged table of floats can give.
bool isColour(const cmsCIELab& lab) {
    constexpr double farOut = 10'000;
    return std::abs(lab.L) < farOut && std::abs(lab.a) < farOut && std::abs(lab.b) < farOut;
}

/// The description in English, or else in the profile's first language. LittleCMS returns one
/// UTF-16 unit per wide character; for older profiles it returns sign-extended bytes, which are
/// read as Latin-1.
std::string descriptionOf(cmsHPROFILE profile) {
    std::array<wchar_t, 1024> units{};
    cmsGetProfileInfo(profile, cmsInfoDescription, "en", "US", units.data(),
                      sizeof units - sizeof units[0]);
    std::string text;
    for (std::size_t i = 0; units[i]; ++i) {
        auto point = static_cast<char32_t>(units[i]);
        const auto next = static_cast<char32_t>(units[i + 1]);
        if (point >= 0xD800 && point < 0xDC00 && next >= 0xDC00 && next < 0xE000) {
            point = 0x10000 + ((point - 0xD800) << 10) + (next - 0xDC00);
            ++i;
        } else if (point >= 0xFFFFFF80) {
            point &= 0xFF;
        } else if ((point >= 0xD800 && point < 0xE000) || point > 0x10FFFF) {
            point = 0xFFFD;
        }
        base::appendUtf8(text, point);
    }
    return text;
}

struct ContextDeleter {
    void operator()(cmsContext context) const { cmsDeleteContext(context); }
};
struct ProfileCloser {
    void operator()(cmsHPROFILE profile) const { cmsCloseProfile(profile); }
};
struct TransformDeleter {
    void operator()(cmsHTRANSFORM transform) const { cmsDeleteTransform(transform); }
};
template<class Handle, class Deleter>
using Owned = std::unique_ptr<std::remove_pointer_t<Handle>, Deleter>;

} // namespace

struct Profile::State {
    // A private context: no setting of other code in the process (error handler, adaptation state,
    // plug-ins) affects the transform. It must be destroyed last.
    Owned<cmsContext, ContextDeleter> context;
    Owned<cmsHTRANSFORM, TransformDeleter> transform;
    std::string description;
};

Profile::Profile() : m_state(std::make_unique<State>()) {}
Profile::~Profile() = default;
Profile::Profile(Profile&&) noexcept = default;
Profile& Profile::operator=(Profile&&) noexcept = default;

bool looksLikeProfile(std::string_view bytes) {
    return bytes.size() >= signatureOffset + 4 && bytes.substr(signatureOffset, 4) == "acsp";
}

Failure Profile::open(std::string_view bytes) {
    if (const Failure failure = checkHeader(bytes); failure != Failure::None) {
        return failure;
    }

    auto state = std::make_unique<State>();
    state->context.reset(cmsCreateContext(nullptr, nullptr));
    if (!state->context) {
        return Failure::OutOfMemory;
    }
    cmsContext context = state->context.get();

    const Owned<cmsHPROFILE, ProfileCloser> profile{
        cmsOpenProfileFromMemTHR(context, bytes.data(), wordAt(bytes, 0))};
    if (!profile) {
        return Failure::ProfileDamaged;
    }
    const Owned<cmsHPROFILE, ProfileCloser> lab{cmsCreateLab4ProfileTHR(context, nullptr)};
    if (!lab) {
        return Failure::OutOfMemory;
    }
    if (!hasMediaWhite(profile.get())) {
        return Failure::ProfileUnusable;
    }

    // The observer is fully adapted, as in the absolute colorimetry of ICC.1: the media white
    // scales XYZ. (ArgyllCMS profiles have their own matrix for that in a private tag, which only
    // its tools use; results differ by up to one unit.) Formats of doubles select LittleCMS's
    // floating-point path.
    std::array<cmsHPROFILE, 2> chain{profile.get(), lab.get()};
    std::array<cmsBool, 2> blackPoint{FALSE, FALSE};
    std::array<cmsUInt32Number, 2> intents{INTENT_ABSOLUTE_COLORIMETRIC,
                                           INTENT_ABSOLUTE_COLORIMETRIC};
    std::array<cmsFloat64Number, 2> adapted{1.0, 1.0};
    state->transform.reset(cmsCreateExtendedTransform(
        context, chain.size(), chain.data(), blackPoint.data(), intents.data(), adapted.data(),
        nullptr, 0, TYPE_CMYK_DBL, TYPE_Lab_DBL, cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE));
    if (!state->transform) {
        return Failure::ProfileUnusable;
    }
    state->description = descriptionOf(profile.get());
    m_state = std::move(state);
    return Failure::None;
}

Failure Profile::evaluate(const double* cmyk, std::size_t count, std::size_t stride,
                          Lab* lab) const {
    std::array<double, 4 * batch> inks;
    std::array<cmsCIELab, batch> colours;
    for (std::size_t done = 0; done < count;) {
        const std::size_t now = std::min(batch, count - done);
        for (std::size_t i = 0; i < now; ++i) {
            for (std::size_t ink = 0; ink < 4; ++ink) {
                inks[4 * i + ink] = inkAmount(cmyk[(done + i) * stride + ink]);
            }
        }
        cmsDoTransform(m_state->transform.get(), inks.data(), colours.data(),
                       static_cast<cmsUInt32Number>(now));
        for (std::size_t i = 0; i < now; ++i) {
            lab[done + i] = {colours[i].L, colours[i].a, colours[i].b};
        }
        if (!std::all_of(colours.begin(), colours.begin() + now, isColour)) {
            return Failure::ProfileUnusable;
        }
        done += now;
    }
    return Failure::None;
}

const std::string& Profile::description() const {
    return m_state->description;
}

} // namespace colour
