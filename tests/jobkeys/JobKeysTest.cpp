// SPDX-License-Identifier: Apache-2.0
// Facts about tickets that no program covers completely.
#include <map>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "jobkeys/Lookups.h"
#include "jobkeys/ResultPositions.h"
#include "jobkeys/ServerPaths.h"
#include "jobkeys/Tickets.h"

namespace {

using namespace jobkeys;

TEST(JobKeys, NamesFilesOfTheServer) {
    const std::pair<std::string, std::string> cases[] = {
        {presetPath("/s", 9), "/s/tickets/CVP_0009.xml"},
        {presetPath("/s", 10), "/s/tickets/CVP_0010.xml"},
        {presetPath("/s", 999), "/s/tickets/CVP_0999.xml"},
        {presetPath("", 12345), "/tickets/CVP_12345.xml"},
        {presetFileName(-7), "CVP_000-7.xml"},
        {controlStripPath("/s", "strip"), "/s/ControlCharts/strip.it8"},
        {controlStripPath("/s", "/a.b/one.two.txt"), "/s/ControlCharts/one.two.it8"},
        {controlStripPath("/s", "/a/.hidden"), "/s/ControlCharts/.hidden.it8"},
        {controlStripPath("/s", "/a.b/"), "/s/ControlCharts/.it8"},
        {characterisationPath("/s", "a.txt"), "/s/IT8_CharacterizationData/a.txt"},
        {characterisationPath("/s", "MKCheck11.MKCheck10"),
         "/s/IT8_CharacterizationData/Fogra_MKCheck10/MKCheck11.MKCheck10"},
        {characterisationPath("/s", "(TEMP)/MKCheck11"), "(TEMP)/MKCheck11"},
    };
    for (const auto& [path, expected] : cases) {
        EXPECT_EQ(path, expected);
    }
}

TEST(JobKeys, FindsThePositionOfEachVerdictThatATicketHas) {
    for (const bool isPsd : {false, true}) {
        int found = 0;
        for (int verdict = -1; verdict < 32; ++verdict) {
            const auto position = positionOfVerdict(verdict, isPsd);
            found += position.has_value();
            EXPECT_EQ(position ? verdictAt(*position, isPsd) : verdict, verdict);
        }
        EXPECT_EQ(found, isPsd ? 10 : 27) << "each verdict has one position";
    }
}

/// The keys that a lookup reads from a ticket, and its result.
template<class LookUp>
std::string traceOf(const std::map<std::string, std::string>& ticket, LookUp lookUp) {
    std::string trace;
    const std::string value = lookUp([&](const std::string& key) {
        trace += key + " ";
        const auto at = ticket.find(key);
        return at == ticket.end() ? "" : at->second;
    });
    return trace + "= " + value;
}

TEST(JobKeys, ReadsAFurtherKeyOnlyIfItIsNeeded) {
    const auto strip = [](auto text) { return fixedStripName(Strip::Second, text); };
    const auto profile = [](auto text) { return referenceProfile(Strip::Second, text); };
    const auto folder = [](auto text) { return jdfFolder(text); };
    const std::string own = "Footer/ControlstripFile2";
    const std::string nested = "Footer/Nesting/ControlstripFile2";
    EXPECT_EQ(traceOf({{own, "four"}, {nested, "n"}}, strip), own + " = four");
    EXPECT_EQ(traceOf({{own, "not"}, {nested, "n"}}, strip), own + " " + nested + " = n");
    EXPECT_EQ(traceOf({{own, "not"}}, strip), own + " " + nested + " = ");
    EXPECT_EQ(traceOf({{"Footer/ControlstripInputProfile2", "p"}, {"Remote/UsedICCProfile", "u"}},
                      profile),
              "Footer/ControlstripInputProfile2 = p");
    EXPECT_EQ(traceOf({{"Remote/UsedICCProfile", "u"}}, profile),
              "Footer/ControlstripInputProfile2 Remote/UsedICCProfile = u");
    EXPECT_EQ(traceOf({{"System/Folders/Temp", "t"}, {"Workflow/RemoteOutFolder", "o"}}, folder),
              "System/Folders/Temp = t");
    EXPECT_EQ(traceOf({{"Workflow/RemoteOutFolder", "o"}}, folder),
              "System/Folders/Temp Workflow/RemoteOutFolder = o");
}

TEST(JobKeys, TakesTheFirstWayToReferencesThatApplies) {
    using enum ReferenceWay;
    // By workflow 0 to 5. Bits: 1 packaging workflow, 2 dynamic strip, 4 stored references.
    const ReferenceWay expected[8][6] = {
        {None, Profile, Characterisation, Profile, None, None},
        {None, Profile, Characterisation, Profile, Packaging, None},
        {DynamicStrip, Profile, DynamicStrip, Profile, DynamicStrip, DynamicStrip},
        {DynamicStrip, Profile, DynamicStrip, Profile, Packaging, DynamicStrip},
        {None, Profile, Characterisation, Stored, None, None},
        {None, Profile, Characterisation, Stored, Packaging, None},
        {DynamicStrip, Profile, DynamicStrip, DynamicStrip, DynamicStrip, DynamicStrip},
        {DynamicStrip, Profile, DynamicStrip, DynamicStrip, Packaging, DynamicStrip},
    };
    for (int bits = 0; bits < 8; ++bits) {
        for (int workflow = 0; workflow < 6; ++workflow) {
            EXPECT_EQ(referenceWay((bits & 1) != 0, workflow, (bits & 2) != 0, (bits & 4) != 0),
                      expected[bits][workflow])
                << bits << " " << workflow;
        }
    }
}

} // namespace
