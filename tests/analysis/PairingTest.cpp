#include "analysis/Pairing.h"

#include <gtest/gtest.h>

using analysis::noRow;
using analysis::PairedBy;
using analysis::pairSets;
using colour::DataSet;
using colour::DeviceSpace;

namespace {

struct Patch {
    const char* id;
    std::vector<double> device;
};

DataSet setOf(DeviceSpace space, const std::vector<Patch>& patches) {
    DataSet set;
    set.patchCount = patches.size();
    set.deviceSpace = space;
    if (space != DeviceSpace::None)
        for (std::size_t i = 0; i < patches.front().device.size(); ++i)
            set.channels.push_back("channel " + std::to_string(i));
    for (const Patch& patch : patches) {
        if (patch.id)
            set.ids.push_back(patch.id);
        set.device.insert(set.device.end(), patch.device.begin(), patch.device.end());
    }
    return set;
}

constexpr auto cmyk = DeviceSpace::Cmyk;
constexpr auto rgb = DeviceSpace::Rgb;
constexpr auto none = DeviceSpace::None;

TEST(Pairing, GoesFromTheSurestToTheWeakest) {
    const std::vector<Patch> ramp = {
        {"1", {0, 0, 0, 0}}, {"2", {50, 0, 0, 0}}, {"3", {0, 7, 0, 0}}};
    const struct {
        const char* what;
        DataSet left, right;
        PairedBy by;
        std::vector<std::uint32_t> partner;
        std::size_t rounded;
    } cases[] = {
        {"one order", setOf(cmyk, ramp), setOf(cmyk, ramp), PairedBy::DeviceValues, {0, 1, 2}, 0},
        {"other ids and order",
         setOf(cmyk, ramp),
         setOf(cmyk, {{"3", {50, 0, 0, 0}}, {"2", {0, 7, 0, 0}}, {"1", {0, 0, 0, 0}}}),
         PairedBy::DeviceValues,
         {2, 0, 1},
         0},
        {"duplicates in their order",
         setOf(cmyk, {{"1", {0, 0, 0, 0}}, {"2", {9, 0, 0, 0}}, {"3", {0, 0, 0, 0}}}),
         setOf(
             cmyk,
             {{"7", {9, 0, 0, 0}}, {"8", {0, 0, 0, 0}}, {"9", {0, 0, 0, 0}}, {"10", {0, 0, 0, 0}}}),
         PairedBy::DeviceValues,
         {1, 0, 2},
         0},
        {"a patch less, with the id of another",
         setOf(cmyk, ramp),
         setOf(cmyk, {{"1", {60, 0, 0, 0}}, {"2", {0, 7, 0, 0}}}),
         PairedBy::DeviceValues,
         {noRow, noRow, 1},
         0},
        {"two decimals against four",
         setOf(cmyk, {{"1", {12.3444, 0, 0, 0}}}),
         setOf(cmyk, {{"1", {12.34, 0, 0, 0}}}),
         PairedBy::DeviceValues,
         {0},
         0},
        {"the nearest first, then whole percents",
         setOf(cmyk, {{"1", {3, 2.24, 2.24, 0}}, {"2", {3.1, 2.2, 2.2, 0}}}),
         setOf(cmyk, {{"1", {3.1, 2.2, 2.2, 0}}, {"2", {3, 2, 2, 0}}}),
         PairedBy::DeviceValues,
         {1, 0},
         1},
        {"unused spot channels",
         setOf(cmyk, ramp),
         setOf(cmyk, {{"1", {50, 0, 0, 0, 0}}, {"2", {0, 0, 0, 0, 100}}}),
         PairedBy::DeviceValues,
         {noRow, 0, noRow},
         0},
        {"nothing alike",
         setOf(rgb, {{"1", {0, 0, 0}}}),
         setOf(rgb, {{"1", {99, 0, 0}}}),
         PairedBy::DeviceValues,
         {noRow},
         0},
        {"ids across device spaces",
         setOf(cmyk, ramp),
         setOf(rgb, {{"3", {0, 0, 0}}, {"2", {0, 0, 0}}, {"9", {0, 0, 0}}}),
         PairedBy::Labels,
         {noRow, 1, 0},
         0},
        {"no ids",
         setOf(cmyk, ramp),
         setOf(none, {{nullptr, {}}, {nullptr, {}}}),
         PairedBy::Order,
         {0, 1, noRow},
         0},
        {"ids of another kind, one size",
         setOf(cmyk, ramp),
         setOf(none, {{"A1", {}}, {"A2", {}}, {"A3", {}}}),
         PairedBy::Order,
         {0, 1, 2},
         0},
        {"ids of another kind, another size",
         setOf(cmyk, ramp),
         setOf(none, {{"A1", {}}}),
         PairedBy::Order,
         {noRow, noRow, noRow},
         0},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        const analysis::Pairing pairing = pairSets(c.left, c.right);
        EXPECT_EQ(pairing.by, c.by);
        EXPECT_EQ(pairing.partner, c.partner);
        EXPECT_EQ(pairing.rounded, c.rounded);
        std::size_t paired = 0;
        for (const std::uint32_t row : pairing.partner)
            paired += row != noRow;
        EXPECT_EQ(pairing.paired, paired);
        EXPECT_EQ(rowsLeft(pairing, c.right.patchCount).size(), c.right.patchCount - paired);
    }
}

TEST(Pairing, ByNameWhereOnlyNamesAgree) {
    DataSet left = setOf(none, {{"1", {}}, {"2", {}}});
    left.names = {"Paper", "Cyan"};
    const DataSet right = setOf(none, {{"Cyan", {}}, {"Gold", {}}, {"Paper", {}}});
    const analysis::Pairing pairing = pairSets(left, right);
    EXPECT_EQ(pairing.by, PairedBy::Labels);
    EXPECT_EQ(pairing.partner, (std::vector<std::uint32_t>{2, 0}));
}

// With a walk over the duplicates this would take hours.
TEST(Pairing, DuplicatesCostNoMoreThanOtherPatches) {
    constexpr std::size_t count = 300'000;
    DataSet left = setOf(cmyk, std::vector<Patch>(count, {"1", {40, 27, 27, 0}}));
    const DataSet right = setOf(cmyk, std::vector<Patch>(count, {"1", {40, 27, 27, 0}}));
    left.device[0] = 41;
    EXPECT_EQ(pairSets(left, right).paired, count - 1);
}

} // namespace
