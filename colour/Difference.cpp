// SPDX-License-Identifier: Apache-2.0
#include "colour/Difference.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace colour {
namespace {

constexpr double radians = std::numbers::pi / 180;

// White of the ICC profile connection space, as used for print data and by colour tools. (The sums
// of the ASTM weights, 96.422 and 82.521, differ by up to 0.02 in b*.)
constexpr Xyz white{96.42, 100.0, 82.49};

// CIE 15:2004, the exact fractions of the curve's two parts.
constexpr double epsilon = 216.0 / 24389.0;
constexpr double kappa = 24389.0 / 27.0;

double squared(double value) {
    return value * value;
}

double chroma(const Lab& lab) {
    return std::sqrt(lab.a * lab.a + lab.b * lab.b);
}

/// A colour in the a*b* plane or the a'b' plane.
struct Plane {
    double a;
    double b;
    double chroma;
};

Plane planeOf(const Lab& lab) {
    return {lab.a, lab.b, chroma(lab)};
}

/// Delta H with its sign: 2 sqrt(C1 C2) sin((h2 - h1) / 2), the hue step taken the short way round.
///
/// Computed from cross and dot product, without angles and without the cancellation of sqrt(dE^2 -
/// dL^2 - dC^2). For exactly opposite hues, both ways are equally long; the step goes from h1 to h2
/// without passing 0.
double hueStep(const Plane& first, const Plane& second) {
    const double chromas = first.chroma * second.chroma;
    if (chromas == 0) {
        return 0;
    }
    const double cross = first.a * second.b - first.b * second.a;
    const double dot = first.a * second.a + first.b * second.b;
    if (dot >= 0) {
        return cross / std::sqrt((chromas + dot) / 2);
    }
    const double step = std::sqrt(2 * (chromas - dot));
    const bool backwards = cross != 0 ? cross < 0 : first.b < 0 || (first.b == 0 && first.a < 0);
    return backwards ? -step : step;
}

/// Direction of the mean hue as cosine and sine: the bisector of the smaller angle. If one colour
/// has no hue, it is the other's.
void meanHue(const Plane& first, const Plane& second, double step, double& cosine, double& sine) {
    double x = first.a + second.a;
    double y = first.b + second.b;
    if (first.chroma != 0 && second.chroma != 0) {
        const double dot = first.a * second.a + first.b * second.b;
        if (dot >= 0) {
            x = first.a * second.chroma + second.a * first.chroma;
            y = first.b * second.chroma + second.b * first.chroma;
        } else { // The sum may cancel: rotate the difference by 90 degrees towards the smaller
                 // angle.
            const double turn = step < 0 ? -1 : 1;
            x = turn * (second.b * first.chroma - first.b * second.chroma);
            y = turn * (first.a * second.chroma - second.a * first.chroma);
        }
    }
    const double length = std::sqrt(x * x + y * y);
    cosine = length > 0 ? x / length : 1;
    sine = length > 0 ? y / length : 0;
}

/// sqrt(C^7 / (C^7 + 25^7))
double seventhPowerShare(double chroma) {
    constexpr double pow25To7 = 6103515625.0;
    const double cube = chroma * chroma * chroma;
    const double pow7 = cube * cube * chroma;
    return std::sqrt(pow7 / (pow7 + pow25To7));
}

/// Hue of a colour in degrees, from 0 to below 360; 0 without a hue.
double hueAngle(const Plane& colour) {
    const double angle = std::atan2(colour.b, colour.a) / radians;
    return angle < 0 ? angle + 360 : angle;
}

double labCurve(double ratio) {
    return ratio > epsilon ? std::cbrt(ratio) : (kappa * ratio + 16) / 116;
}

double labCurveInverse(double value) {
    const double cube = value * value * value;
    return cube > epsilon ? cube : (116 * value - 16) / kappa;
}

} // namespace

Formula formulaFromNumber(int number) {
    switch (number) {
    case 2:
        return Formula::Cmc11;
    case 3:
        return Formula::Cie94;
    case 4:
        return Formula::Ciede2000;
    case 5:
        return Formula::Cmc21;
    default:
        return Formula::Cie76;
    }
}

const char* formulaName(Formula formula) {
    switch (formula) {
    case Formula::Cmc11:
        return "CIECMC";
    case Formula::Cie94:
        return "CIE94";
    case Formula::Ciede2000:
        return "CIE2000";
    case Formula::Cmc21:
        return "CIECMC_2_1";
    case Formula::Cie76:
        break;
    }
    return "CIE76";
}

double difference(Formula formula, const Lab& target, const Lab& measured) {
    switch (formula) {
    case Formula::Cmc11:
        return deltaECmc(target, measured, 1, 1);
    case Formula::Cie94:
        return deltaE94(target, measured);
    case Formula::Ciede2000:
        return deltaE2000(target, measured);
    case Formula::Cmc21:
        return deltaECmc(target, measured, 2, 1);
    case Formula::Cie76:
        break;
    }
    return deltaE76(target, measured);
}

double deltaE76(const Lab& target, const Lab& measured) {
    return std::sqrt(squared(measured.L - target.L) + squared(measured.a - target.a) +
                     squared(measured.b - target.b));
}

// CIE 116-1995 with the parameters for graphic arts. The weights use the reference's chroma, as the
// publication specifies for a pair with a standard.
double deltaE94(const Lab& target, const Lab& measured) {
    const Plane reference = planeOf(target);
    const Plane sample = planeOf(measured);
    const double weightChroma = 1 + 0.045 * reference.chroma;
    const double weightHue = 1 + 0.015 * reference.chroma;
    return std::sqrt(squared(measured.L - target.L) +
                     squared((sample.chroma - reference.chroma) / weightChroma) +
                     squared(hueStep(reference, sample) / weightHue));
}

// CIE 142-2001, in the notation of Sharma, Wu and Dalal (Color Research and Application 30, 2005).
// Only one arc tangent is needed: the direction of the mean hue gives all its cosines.
double deltaE2000(const Lab& target, const Lab& measured) {
    const double meanChroma = (chroma(target) + chroma(measured)) / 2;
    const double stretch = 1 + 0.5 * (1 - seventhPowerShare(meanChroma));
    const Lab scaledTarget{target.L, target.a * stretch, target.b};
    const Lab scaledMeasured{measured.L, measured.a * stretch, measured.b};
    const Plane first = planeOf(scaledTarget);
    const Plane second = planeOf(scaledMeasured);

    const double dL = measured.L - target.L;
    const double dC = second.chroma - first.chroma;
    const double dH = hueStep(first, second);

    double cos1 = 1;
    double sin1 = 0;
    meanHue(first, second, dH, cos1, sin1);
    const double cos2 = cos1 * cos1 - sin1 * sin1;
    const double sin2 = 2 * cos1 * sin1;
    const double cos3 = cos2 * cos1 - sin2 * sin1;
    const double sin3 = sin2 * cos1 + cos2 * sin1;
    const double cos4 = cos2 * cos2 - sin2 * sin2;
    const double sin4 = 2 * cos2 * sin2;
    constexpr double cos30 = 0.86602540378443864676, sin30 = 0.5;
    constexpr double cos6 = 0.99452189536827333692, sin6 = 0.10452846326765347140;
    constexpr double cos63 = 0.45399049973954679156, sin63 = 0.89100652418836786236;
    const double T = 1 - 0.17 * (cos1 * cos30 + sin1 * sin30) + 0.24 * cos2 +
                     0.32 * (cos3 * cos6 - sin3 * sin6) - 0.20 * (cos4 * cos63 + sin4 * sin63);

    const double meanL = (target.L + measured.L) / 2;
    const double meanC = (first.chroma + second.chroma) / 2;
    const double lightness2 = squared(meanL - 50);
    const double SL = 1 + 0.015 * lightness2 / std::sqrt(20 + lightness2);
    const double SC = 1 + 0.045 * meanC;
    const double SH = 1 + 0.015 * meanC * T;

    double hue = std::atan2(sin1, cos1) / radians;
    if (hue < 0) {
        hue += 360;
    }
    const double dTheta = 30 * std::exp(-squared((hue - 275) / 25));
    const double RT = -2 * seventhPowerShare(meanC) * std::sin(2 * dTheta * radians);

    const double l = dL / SL;
    const double c = dC / SC;
    const double h = dH / SH;
    return std::sqrt(std::max(0.0, l * l + c * c + h * h + RT * c * h));
}

// BS 6923:1988, following Clarke, McDonald and Rigg.
double deltaECmc(const Lab& target, const Lab& measured, double lightness, double chroma) {
    const Plane reference = planeOf(target);
    const Plane sample = planeOf(measured);
    const double hue = hueAngle(reference);
    const double T = hue >= 164 && hue <= 345
                         ? 0.56 + std::abs(0.2 * std::cos((hue + 168) * radians))
                         : 0.36 + std::abs(0.4 * std::cos((hue + 35) * radians));
    const double chroma4 = squared(squared(reference.chroma));
    const double F = std::sqrt(chroma4 / (chroma4 + 1900));
    const double SL = target.L < 16 ? 0.511 : 0.040975 * target.L / (1 + 0.01765 * target.L);
    const double SC = 0.0638 * reference.chroma / (1 + 0.0131 * reference.chroma) + 0.638;
    const double SH = SC * (F * T + 1 - F);
    return std::sqrt(squared((measured.L - target.L) / (lightness * SL)) +
                     squared((sample.chroma - reference.chroma) / (chroma * SC)) +
                     squared(hueStep(reference, sample) / SH));
}

double deltaH(const Lab& target, const Lab& measured) {
    return std::abs(hueStep(planeOf(target), planeOf(measured)));
}

double deltaCh(const Lab& target, const Lab& measured) {
    return std::sqrt(squared(measured.a - target.a) + squared(measured.b - target.b));
}

Lab labFromXyz(const Xyz& xyz) {
    const double x = labCurve(xyz.X / white.X);
    const double y = labCurve(xyz.Y / white.Y);
    const double z = labCurve(xyz.Z / white.Z);
    return {116 * y - 16, 500 * (x - y), 200 * (y - z)};
}

Xyz xyzFromLab(const Lab& lab) {
    const double y = (lab.L + 16) / 116;
    return {white.X * labCurveInverse(y + lab.a / 500), white.Y * labCurveInverse(y),
            white.Z * labCurveInverse(y - lab.b / 200)};
}

} // namespace colour
