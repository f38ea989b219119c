// SPDX-License-Identifier: Apache-2.0
#include "colour/Profile.h"

#include <random>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "colour/Difference.h"

using namespace colour;
using support::contentsOf;

namespace {

const std::string iccFolder = "/usr/share/color/icc/";
const std::string press = iccFolder + "ghostscript/default_cmyk.icc"; // version 2, with grey paper
const std::string newer = iccFolder + "ghostscript/ps_cmyk.icc";      // version 4

/// Paper, the solids, all inks together, then random patches.
std::vector<double> someInks(std::size_t count) {
    std::mt19937 engine(4); // NOLINT: the same patches each time
    std::uniform_real_distribution<double> percent(0, 100);
    std::vector<double> inks = {0, 0, 0,   0, 100, 0, 0, 0,   0,   100, 0,   0,
                                0, 0, 100, 0, 0,   0, 0, 100, 100, 100, 100, 100};
    while (inks.size() < 4 * count) {
        inks.push_back(percent(engine));
    }
    return inks;
}

/// The colours printed by a command whose input is the inks, one patch per line.
std::vector<Lab> ask(const std::string& command, const std::vector<double>& inks, double scale) {
    const support::ScratchFolder folder;
    std::ostringstream lines;
    lines.precision(12);
    for (std::size_t i = 0; i < inks.size(); ++i) {
        lines << inks[i] * scale << (i % 4 == 3 ? '\n' : ' ');
    }
    const auto outcome =
        support::run({"sh", "-c", command + " < " + folder.write("inks", lines.str())});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
    std::istringstream answers(outcome.output);
    std::vector<Lab> labs;
    for (Lab lab; answers >> lab.L >> lab.a >> lab.b;) {
        labs.push_back(lab);
    }
    return labs;
}

std::vector<Lab> evaluate(const Profile& profile, const std::vector<double>& inks,
                          std::size_t channels = 4) {
    std::vector<Lab> labs(inks.size() / channels);
    EXPECT_EQ(profile.evaluate(inks.data(), labs.size(), channels, labs.data()), Failure::None);
    return labs;
}

} // namespace

// icclu interpolates differently, so it is asked only for nodes of the table. It supports nothing
// newer than version 2.
TEST(Profile, AgreesWithTransiccAndIcclu) {
    const std::vector<double> inks = someInks(1200); // more than one call of LittleCMS
    for (const std::string& path : {press, newer}) {
        Profile profile;
        ASSERT_EQ(profile.open(contentsOf(path)), Failure::None);
        const auto labs = evaluate(profile, inks);
        const auto transicc = ask("transicc -n -t3 '-o*Lab4' -i" + path, inks, 1);
        ASSERT_EQ(transicc.size(), labs.size());
        for (std::size_t i = 0; i < labs.size(); ++i) {
            ASSERT_LE(deltaE76(labs[i], transicc[i]), 0.01) << path << i;
        }
    }
    Profile profile;
    ASSERT_EQ(profile.open(contentsOf(press)), Failure::None);
    EXPECT_EQ(profile.description(), "Artifex CMYK SWOP Profile");
    const auto nodes = evaluate(profile, someInks(6));
    const auto icclu = ask("icclu -v0 -ff -ia -pl " + press, someInks(6), 0.01);
    ASSERT_EQ(icclu.size(), 6U);
    for (std::size_t i = 0; i < 6; ++i) {
        EXPECT_LE(deltaE76(nodes[i], icclu[i]), 0.01) << i;
    }

    // Channels after the first four are skipped, and inks are clamped to 0 to 100.
    const auto wide = evaluate(profile, {-3, 130, 0, 0, 55, 99, 0, 0, 100, 0, 55, 99}, 6);
    EXPECT_EQ(deltaE76(wide[0], nodes[2]), 0);
    EXPECT_EQ(deltaE76(wide[1], nodes[3]), 0);
}

TEST(Profile, OneFailureForOneCause) {
    const std::string good = contentsOf(press);
    const auto with = [&](std::size_t at, const std::string& bytes) {
        std::string text = good;
        return text.replace(at, bytes.size(), bytes);
    };
    std::string noTables = good;
    for (std::size_t at = 0; (at = noTables.find("A2B", at)) != std::string::npos;) {
        noTables.replace(at, 3, "xxx");
    }
    const std::pair<std::string, Failure> cases[] = {
        {"", Failure::ProfileDamaged},
        {with(36, "x"), Failure::ProfileDamaged}, // no signature
        {good.substr(0, good.size() - 1), Failure::ProfileDamaged},
        {contentsOf(iccFolder + "sRGB.icc"), Failure::ProfileColourSpace},
        {with(12, "link"), Failure::ProfileClass},
        {with(good.find("wtpt"), "xxxx"), Failure::ProfileUnusable}, // no media white
        {noTables, Failure::ProfileUnusable},
        {good + std::string(64, '\0'), Failure::None},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Profile().open(c.first), c.second) << &c - cases;
    }
}
