// SPDX-License-Identifier: Apache-2.0
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "CheckTest.h"

namespace {

using namespace checktest;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

TEST_F(CheckTest, SaysWhatTheToolSays) {
    const std::map<std::string, int> statuses = {{"passed", 0}, {"failed", 1}, {"incomplete", 2}};
    const std::string few = m_scratch.write("few greys.txt", wedge(0, false));
    const std::string profile = icc + "ghostscript/default_cmyk.icc";
    const std::vector<std::string> files = {icc + "FOGRA39L.ti3", icc + "FOGRA28L.ti3",
                                            icc + "TR006.ti3", few, profile};
    const std::string tool = m_scratch.path("tool.json");
    int compared = 0;
    for (const std::string& target : files) {
        for (const std::string& measurement : files) {
            for (const auto& [preset, patchSet] :
                 {std::pair("CVP_0001.xml", std::string()), std::pair("CVP_0005.xml", few)}) {
                SCOPED_TRACE(target + " " + measurement + " " + preset);
                std::vector<std::string> words = {"-t", target, "-p", presets + preset,
                                                  measurement};
                std::vector<std::string> ofTool = {TINTGATE, target, measurement, presets + preset,
                                                   tool};
                if (!patchSet.empty()) {
                    words.insert(words.end(), {"--patch-set", patchSet});
                    ofTool.push_back(patchSet);
                }
                fs::remove(tool);
                const int code = support::run(ofTool).exitCode;
                std::vector<std::string> withResult = words;
                withResult.insert(withResult.end(), {"--result", "--out", m_scratch.path("out")});
                const support::Outcome outcome = check(withResult);
                const Json line = lines(words).at(0);
                if (code != 0) {
                    EXPECT_EQ(outcome.exitCode, 3);
                    EXPECT_EQ(line["error"]["code"], code);
                    continue;
                }
                const std::string text = support::contentsOf(tool);
                const std::string name = fs::path(measurement).stem().string() + ".json";
                EXPECT_EQ(support::contentsOf(m_scratch.path("out/" + name)), text);
                const Json result = Json::parse(text);
                EXPECT_EQ(outcome.exitCode, statuses.at(result["verdict"]));
                for (const char* member : {"verdict", "passed", "formula", "preset", "inputs",
                                           "pairing", "statistics", "criteria", "warnings"}) {
                    EXPECT_EQ(line[member], result[member]) << member;
                }
                ++compared;
            }
        }
    }
    EXPECT_EQ(compared, 49); // two profiles need a patch set
}

TEST_F(CheckTest, FindsWhatAPrintIsComparedWith) {
    const std::string good = m_scratch.write("proof.txt", wedge(0));
    m_scratch.write("settings/references/House.txt", wedge(0));
    m_scratch.write("settings/presets/house-proof.xml",
                    support::contentsOf(presets + "CVP_0004.xml"));
    m_scratch.write("settings/far/target.txt", wedge(1));
    const std::string file = m_scratch.write("settings/conditions.toml", R"(
default = "b"
[conditions.a]
target = "house"
preset = "house-proof"
[conditions.b]
target = "far/target.txt"
preset = 2
patch-set = "FOGRA39L.ti3"
paper = "Paper & 235"
printer = "Proofer 2"
)");
    // What is chosen, and the ends of target, preset and patch set ("" for none) in the result.
    const std::string here = m_scratch.write("CVP_0003.xml", "<?xml");
    const std::vector<std::pair<std::vector<std::string>, std::vector<std::string>>> table = {
        {{}, {"settings/far/target.txt", "CVP_0002.xml", "icc/FOGRA39L.ti3", "b"}},
        {{"-c", "a"}, {"references/House.txt", "presets/house-proof.xml", "", "a"}},
        {{"-c", "a", "-p", "g7-colorspace"}, {"House.txt", "CVP_0006.xml", "", "a"}},
        {{"-c", "b", "-t", "tr003"}, {"icc/TR003.ti3", "CVP_0002.xml", "FOGRA39L.ti3", "b"}},
        {{"-t", "TR003.ti3"}, {"icc/TR003.ti3", "CVP_0001.xml", "", ""}},
        {{"-t", "ghostscript/ps_cmyk.icc"}, {"ghostscript/ps_cmyk.icc", "CVP_0001.xml", "", ""}},
        {{"-t", "proof.txt", "-p", "3"}, {"proof.txt", "CVP_0003.xml", "", ""}},
        {{"-t", "proof.txt", "--patch-set", good}, {"proof.txt", "CVP_0001.xml", good, ""}},
    };
    const auto endOf = [](const Json& value) { return value.is_null() ? "" : value.dump(); };
    for (const auto& [words, expected] : table) {
        std::vector<std::string> all = {"--conditions", file, "proof.txt"};
        all.insert(all.end(), words.begin(), words.end());
        SCOPED_TRACE(testing::PrintToString(words));
        const Json line = lines(all).at(0);
        const Json& inputs = line["inputs"];
        EXPECT_THAT(endOf(inputs["target"]["path"]), HasSubstr(expected[0] + "\""));
        EXPECT_THAT(endOf(line["preset"]["file"]), HasSubstr(expected[1] + "\""));
        EXPECT_THAT(inputs["patchSet"].is_null() ? "" : endOf(inputs["patchSet"]["path"]),
                    HasSubstr(expected[2]));
        EXPECT_EQ(inputs["patchSet"].is_null(), expected[2].empty());
        EXPECT_EQ(line["condition"].is_null() ? "" : line["condition"], expected[3]);
    }

    // The user's file precedes the system's, and texts of a condition are on the page.
    m_scratch.write("root/etc/tintgate/conditions.toml", "[conditions.system]\ntarget='TR002'");
    EXPECT_THAT(check({"--list"}).output, HasSubstr("system"));
    fs::create_directories(m_scratch.path("home/.config"));
    fs::create_symlink(m_scratch.path("settings"), m_scratch.path("home/.config/tintgate"));
    const std::string list = check({"--list"}).output;
    EXPECT_THAT(list, Not(HasSubstr("system")));
    for (const char* part : {"b  ", "(default)", "house-proof", "contract-proof ", "House.txt",
                             "FOGRA39L.ti3", "1617 patches", "default_cmyk.icc"}) {
        EXPECT_THAT(list, HasSubstr(part));
    }
    EXPECT_THAT(list, Not(HasSubstr("sRGB")));
    check({"proof.txt", "--page"});
    EXPECT_THAT(support::contentsOf(m_scratch.path("proof.html")), HasSubstr("Paper \\u0026 235"));
}

/// The statuses of one run, and their order: not done, failed, incomplete, passed.
TEST_F(CheckTest, EndsWithTheHighestStatus) {
    m_scratch.write("passed.txt", wedge(0));
    m_scratch.write("failed.txt", wedge(8));
    m_scratch.write("incomplete.txt", wedge(0, false));
    m_scratch.write("broken.txt", "no");
    const std::vector<std::pair<std::vector<std::string>, int>> table = {
        {{"passed.txt", "passed.txt"}, 0},
        {{"passed.txt", "incomplete.txt"}, 2},
        {{"failed.txt", "incomplete.txt", "passed.txt"}, 1},
        {{"broken.txt", "failed.txt", "incomplete.txt"}, 3},
        {{"."}, 3},
    };
    for (const auto& [files, status] : table) {
        for (const char* way : {"--json", "--quiet", "-j1"}) {
            std::vector<std::string> words = {"-t", "FOGRA39L", way};
            words.insert(words.end(), files.begin(), files.end());
            const support::Outcome outcome = check(words);
            EXPECT_EQ(outcome.exitCode, status) << testing::PrintToString(words);
            EXPECT_EQ(outcome.output.empty(), std::string(way) == "--quiet");
            EXPECT_EQ(outcome.error, "");
        }
    }
    const std::string text = check({"-t", "FOGRA39L", "."}).output;
    EXPECT_THAT(text,
                HasSubstr("4 measurements: 1 passed, 1 failed, 1 incomplete, 1 not verified"));
    EXPECT_THAT(text, HasSubstr("\nFailed\n  ./failed.txt\n"));
    EXPECT_THAT(text, HasSubstr("\nIncomplete\n  ./incomplete.txt\n"));
    EXPECT_THAT(text, HasSubstr("    ./broken.txt\n"));
}

TEST_F(CheckTest, ReplacesNothingButItsOwn) {
    const std::string proof = m_scratch.write("day/proof.txt", wedge(0));
    const std::vector<std::string> words = {"-t", "FOGRA39L", "--page", "--result", proof};
    EXPECT_EQ(check(words).exitCode, 0);
    const std::string page = m_scratch.path("day/proof.html");
    const std::string result = m_scratch.path("day/proof.json");
    const std::string first = support::contentsOf(page);
    EXPECT_THAT(first, HasSubstr("\"verdict\":\"passed\""));

    // An earlier output, also through a link, and a newer measurement.
    m_scratch.write("day/proof.txt", wedge(8));
    fs::rename(page, m_scratch.path("page.html"));
    fs::create_symlink("../page.html", page);
    EXPECT_EQ(check(words).exitCode, 1);
    EXPECT_TRUE(fs::is_symlink(page));
    EXPECT_THAT(support::contentsOf(page), HasSubstr("\"verdict\":\"failed\""));

    // What is not ours: text that only mentions a result, another page, nothing, a folder.
    fs::remove(page);
    for (const std::string text : {"{\"format\": \"other\"}", "<html></html>", ""}) {
        m_scratch.write("day/proof.html", text);
        m_scratch.write("day/proof.json", text);
        EXPECT_EQ(check(words).exitCode, 3);
        EXPECT_EQ(support::contentsOf(page), text);
        EXPECT_EQ(support::contentsOf(result), text);
    }
    fs::remove(result);
    m_scratch.makeFolder("day/proof.json");
    fs::remove(page);
    EXPECT_EQ(check(words).exitCode, 3);
    EXPECT_TRUE(support::exists(page));

    // Inputs, under their own and under other names.
    const std::string target = m_scratch.write("target.json", wedge(0));
    fs::create_hard_link(target, m_scratch.path("other.json"));
    m_scratch.write("other.txt", wedge(0));
    EXPECT_EQ(check({"-t", target, "--result", "other.txt"}).exitCode, 3);
    EXPECT_EQ(check({"-t", "FOGRA39L", "--result", "target.json"}).exitCode, 3);
    EXPECT_EQ(support::contentsOf(target), wedge(0));
}

TEST_F(CheckTest, WritesTheSameTreeBelowAnotherFolder) {
    const std::string odd = "ü \xFF\n1";
    for (const std::string name : {"in/a/1.txt", "in/b/1.TXT", "in/2.cgats", "in/.hidden.txt",
                                   "in/.git/x.txt", "in/notes.md"}) {
        m_scratch.write(name, wedge(0));
    }
    m_scratch.write("in/" + odd + ".txt", wedge(0));
    fs::create_directory_symlink("../in", m_scratch.path("in/loop"));
    const auto found = lines({"-t", "FOGRA39L", "--result", "--out", "out", "in", "in/2.cgats"});
    std::vector<std::string> written;
    for (const Json& line : found) {
        EXPECT_EQ(line["verdict"], "passed") << line;
        written.push_back(line["written"].at(0));
    }
    EXPECT_THAT(written, ElementsAre("out/2.json", "out/a/1.json", "out/b/1.json",
                                     "out/ü \uFFFD\n1.json", "out/in/2.json"));
    EXPECT_TRUE(support::exists(m_scratch.path("out/" + odd + ".json")));
    // Control characters don't act on a terminal.
    EXPECT_THAT(check({"-t", "FOGRA39L", "in"}).output, HasSubstr("ü \\xFF\\x0A1.txt"));
}

TEST_F(CheckTest, KeepsTheOrderInParallel) {
    std::string expected;
    for (int i = 100; i < 300; ++i) {
        // Each takes another time: the target's own data are large.
        const std::string name = "in/" + std::to_string(i) + ".ti3";
        m_scratch.write(name, i % 7 == 0 ? support::contentsOf(icc + "TR006.ti3")
                                         : wedge(i % 3 == 0 ? 8 : 0));
    }
    const std::string one = check({"-t", "FOGRA39L", "-j1", "--json", "in"}).output;
    EXPECT_EQ(std::count(one.begin(), one.end(), '\n'), 200);
    EXPECT_EQ(check({"-t", "FOGRA39L", "-j8", "--json", "in"}).output, one);
    // A profile as the target is evaluated by all threads.
    const std::string profile = icc + "ghostscript/default_cmyk.icc";
    const std::string alone = check({"-t", profile, "-j1", "--json", "in"}).output;
    EXPECT_EQ(check({"-t", profile, "-j8", "--json", "in"}).output, alone);
}

} // namespace
