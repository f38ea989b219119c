// SPDX-License-Identifier: Apache-2.0
// Colour differences of 100,000 pairs, against LittleCMS if it has the formula.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <functional>
#include <limits>
#include <random>
#include <vector>

#include <lcms2.h>

#include "Fastest.h"
#include "colour/Difference.h"

using namespace colour;

namespace {

constexpr std::size_t count = 100'000;

using Peer = cmsFloat64Number (*)(const cmsCIELab*, const cmsCIELab*);

cmsFloat64Number peer2000(const cmsCIELab* first, const cmsCIELab* second) {
    return cmsCIE2000DeltaE(first, second, 1, 1, 1);
}

cmsFloat64Number peerCmc(const cmsCIELab* first, const cmsCIELab* second) {
    return cmsCMCdeltaE(first, second, 2, 1);
}

} // namespace

int main() {
    std::mt19937 engine(1); // NOLINT: the same pairs each time
    std::uniform_real_distribution<double> lightness(0, 100);
    std::uniform_real_distribution<double> wide(-90, 90);
    std::normal_distribution<double> near(0, 2);
    std::vector<Lab> targets;
    std::vector<Lab> measured;
    for (std::size_t i = 0; i < count; ++i) {
        const Lab lab{lightness(engine), wide(engine), wide(engine)};
        targets.push_back(lab);
        measured.push_back({lab.L + near(engine), lab.a + near(engine), lab.b + near(engine)});
    }
    const auto asPeer = [](const Lab& lab) { return cmsCIELab{lab.L, lab.a, lab.b}; };

    const struct {
        Formula formula;
        Peer peer;
    } cases[] = {{Formula::Cie76, cmsDeltaE},
                 {Formula::Cie94, cmsCIE94DeltaE},
                 {Formula::Cmc21, peerCmc},
                 {Formula::Ciede2000, peer2000}};
    for (const auto& c : cases) {
        const double ours = bench::fastest([&] {
            double sum = 0;
            for (std::size_t i = 0; i < count; ++i) {
                sum += difference(c.formula, targets[i], measured[i]);
            }
            return sum;
        });
        const double theirs = bench::fastest([&] {
            double sum = 0;
            for (std::size_t i = 0; i < count; ++i) {
                const cmsCIELab first = asPeer(targets[i]);
                const cmsCIELab second = asPeer(measured[i]);
                sum += c.peer(&first, &second);
            }
            return sum;
        });
        std::printf("%-10s %zu pairs %6.2f ms, %.2f times LittleCMS\n", formulaName(c.formula),
                    count, ours, ours / theirs);
    }
}
