// SPDX-License-Identifier: Apache-2.0
// Reading CGATS text against a bare loop that splits the same bytes and calls strtod.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <limits>
#include <random>
#include <string>

#include "Fastest.h"
#include "colour/CgatsText.h"

using namespace colour;

namespace {

std::string makeText(std::size_t patches, bool withSpectra) {
    std::mt19937 engine(1); // NOLINT: the same patches each time
    std::uniform_real_distribution<double> unit(0, 1);
    std::string text = "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\t"
                       "XYZ_X\tXYZ_Y\tXYZ_Z\tLAB_L\tLAB_A\tLAB_B";
    for (int nm = 380; withSpectra && nm <= 730; nm += 10) {
        text += "\tSPECTRAL_NM" + std::to_string(nm);
    }
    text += "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " + std::to_string(patches) + "\nBEGIN_DATA\n";
    const auto add = [&](const char* format, double value) {
        char number[32];
        std::snprintf(number, sizeof number, format, value);
        text += number;
    };
    for (std::size_t i = 0; i < patches; ++i) {
        text += std::to_string(i + 1);
        for (int k = 0; k < 4; ++k) {
            add("\t%.0f", 100 * unit(engine));
        }
        for (int k = 0; k < 4; ++k) {
            add("\t%.2f", 100 * unit(engine));
        }
        for (int k = 0; k < 2; ++k) {
            add("\t%.2f", 120 * unit(engine) - 60);
        }
        for (int k = 0; withSpectra && k < 36; ++k) {
            add("\t%.4f", unit(engine));
        }
        text += '\n';
    }
    return text + "END_DATA\n";
}

double splitAndConvert(const std::string& text) {
    const auto isBlank = [](char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r'; };
    double sum = 0;
    const char* at = text.c_str();
    while (*at != '\0') {
        while (isBlank(*at)) {
            ++at;
        }
        char* end = nullptr;
        sum += std::strtod(at, &end);
        at = end;
        while (*at != '\0' && !isBlank(*at)) {
            ++at;
        }
    }
    return sum;
}

double read(const std::string& text, bool spectra) {
    DataSet set;
    if (readCgats(text, {spectra}, set) != Failure::None) {
        std::abort();
    }
    return static_cast<double>(set.patchCount);
}

void compare(const char* what, const std::string& text, bool spectra) {
    const double bare = bench::fastest([&] { return splitAndConvert(text); });
    const double ours = bench::fastest([&] { return read(text, spectra); });
    std::printf("%-44s %8.2f ms  bare %8.2f ms  ratio %.2f\n", what, ours, bare, ours / bare);
}

} // namespace

int main() {
    compare("1,617 patches, 11 columns", makeText(1617, false), true);
    compare("100,000 patches, 11 columns", makeText(100'000, false), true);
    compare("1,000,000 patches, 11 columns", makeText(1'000'000, false), true);
    compare("100,000 patches, 47 columns", makeText(100'000, true), true);
    compare("100,000 patches, 47 columns, spectra skipped", makeText(100'000, true), false);
}
