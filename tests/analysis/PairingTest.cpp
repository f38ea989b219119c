// SPDX-License-Identifier: Apache-2.0
#include "analysis/Pairing.h"

#include <sstream>

#include <gtest/gtest.h>

using analysis::pairSets;
using colour::DataSet;
using colour::DeviceSpace;

namespace {

/// Makes a set from one line: the device space, then "id:C,M,Y,K ...". Nothing before the colon
/// means no id, and nothing after it means no device values.
DataSet setOf(const std::string& line) {
    DataSet set;
    std::istringstream patches(line);
    std::string space;
    patches >> space;
    set.deviceSpace = space == "cmyk"  ? DeviceSpace::Cmyk
                      : space == "rgb" ? DeviceSpace::Rgb
                                       : DeviceSpace::None;
    for (std::string patch; patches >> patch; ++set.patchCount) {
        const std::size_t colon = patch.find(':');
        if (colon > 0) {
            set.ids.push_back(patch.substr(0, colon));
        }
        std::istringstream values(patch.substr(colon + 1));
        for (std::string value; std::getline(values, value, ',');) {
            set.device.push_back(std::stod(value));
        }
    }
    set.channels.resize(set.device.size() / set.patchCount);
    return set;
}

/// "deviceValues 0 - 2 +0:3": the method, each left row's partner, and right rows paired again.
std::string said(const analysis::Pairing& pairing) {
    std::string text = pairedByName(pairing.by);
    for (const std::uint32_t row : pairing.partner) {
        text += " " + (row == analysis::noRow ? "-" : std::to_string(row));
    }
    for (const auto& [left, right] : pairing.again) {
        text += " +" + std::to_string(left) + ":" + std::to_string(right);
    }
    return text;
}

TEST(Pairing, GoesFromTheSurestToTheWeakest) {
    const std::string ramp = "cmyk 1:0,0,0,0 2:50,0,0,0 3:0,7,0,0";
    const struct {
        const char* what;
        std::string left, right, pairing;
        std::size_t rounded = 0;
    } cases[] = {
        {"other ids and order", ramp, "cmyk 3:50,0,0,0 2:0,7,0,0 1:0,0,0,0", "deviceValues 2 0 1"},
        {"duplicates in their order", "cmyk 1:0,0,0,0 2:9,0,0,0 3:0,0,0,0",
         "cmyk 7:9,0,0,0 8:0,0,0,0 9:0,0,0,0 10:0,0,0,0", "deviceValues 1 0 2 +0:3"},
        {"more on either side", "cmyk 1:0,0,0,0 2:9,0,0,0 3:0,0,0,0",
         "cmyk 1:9,0,0,0 2:0,0,0,0 3:9,0,0,0", "deviceValues 1 0 1 +1:2"},
        {"repeats in turn", "cmyk 1:9,0,0,0 2:9,0,0,0",
         "cmyk 1:9,0,0,0 2:9,0,0,0 3:9,0,0,0 4:9,0,0,0 5:9.001,0,0,0",
         "deviceValues 0 1 +0:2 +1:3 +0:4"},
        {"nearly a repeat", "cmyk 1:3.1,2.2,2.2,0", "cmyk 1:3.1,2.2,2.2,0 2:3,2.24,2.24,0",
         "deviceValues 0"},
        {"an id for two patches", ramp, "cmyk 1:60,0,0,0 2:0,7,0,0", "deviceValues - - 1"},
        {"two decimals", "cmyk 1:12.3444,0,0,0", "cmyk 1:12.34,0,0,0", "deviceValues 0"},
        {"the nearest first, then whole percents", "cmyk 1:3,2.24,2.24,0 2:3.1,2.2,2.2,0",
         "cmyk 1:3.1,2.2,2.2,0 2:3,2,2,0", "deviceValues 1 0", 1},
        {"spots", ramp, "cmyk 1:50,0,0,0,0 2:0,0,0,0,100", "deviceValues - 0 -"},
        {"ids across spaces", ramp, "rgb 3:0,0,0 2:0,0,0 9:0,0,0", "labels - 1 0"},
        {"no ids", ramp, "none : :", "order 0 1 -"},
        {"ids of another kind, one size", ramp, "none A1: A2: A3:", "order 0 1 2"},
    };
    for (const auto& c : cases) {
        const analysis::Pairing pairing = pairSets(setOf(c.left), setOf(c.right));
        EXPECT_EQ(said(pairing), c.pairing) << c.what;
        EXPECT_EQ(pairing.rounded, c.rounded) << c.what;
    }
    DataSet named = setOf("none 1: 2:");
    named.names = {"Paper", "Cyan"};
    EXPECT_EQ(said(pairSets(named, setOf("none Cyan: Gold: Paper:"))), "labels 2 0");
}

// Visiting every duplicate would take hours here.
TEST(Pairing, DuplicatesCostNoMoreThanOtherPatches) {
    constexpr std::size_t count = 300'000;
    DataSet left = setOf("cmyk 1:40,40,40,40");
    left.patchCount = count;
    left.device.assign(count * 4, 40);
    const DataSet right = left;
    left.device[0] = 41;
    EXPECT_EQ(pairSets(left, right).paired, count - 1);
}

} // namespace
