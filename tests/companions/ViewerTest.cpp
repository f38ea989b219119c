// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <unistd.h>
#include <utime.h>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Browse.h"

namespace {

using testing::HasSubstr;
using testing::Not;

const std::string data = TINTGATE_SOURCE_DIR "/tests/data/report/";
const std::string pageName = "report-strip2-2024-05-01-123456.html";

support::RunOptions withoutDisplay() {
    support::RunOptions options;
    options.environment = {{"DISPLAY", std::nullopt},
                           {"WAYLAND_DISPLAY", std::nullopt},
                           {"TINTGATE_ROOT", "/nonexistent"}};
    return options;
}

bool awaitFile(const std::string& path) {
    for (int waited = 0; waited < 1000 && !support::exists(path); ++waited) {
        usleep(10'000);
    }
    return support::exists(path);
}

/// A job's folder with both files of a run. Its name has blanks and a non-ASCII character.
class Viewer : public testing::Test {
  protected:
    Viewer() {
        m_scratch.makeFolder("Größe a b");
        for (const char* name : {"meta.json", "output.json"}) {
            std::filesystem::copy_file(data + name, m_folder + "/" + name);
        }
    }

    support::Outcome show(const support::RunOptions& options = withoutDisplay()) const {
        return support::run(
            {VIEWER, "-detail", "-meta", m_scratch.path("Größe"), "a", "b/meta.json"}, options);
    }

    const support::ScratchFolder m_scratch;
    const std::string m_folder = m_scratch.path("Größe a b");
    const std::string m_page = m_folder + "/" + pageName;
};

TEST_F(Viewer, ShowsTheVerdictAndRunsNothingOfATicket) {
    ASSERT_EQ(show().exitCode, 0);
    // The page's policy blocks even injected markup: script, image and handler.
    std::string page = support::contentsOf(m_page);
    page.insert(page.find("<header>"),
                "<script>document.documentElement.lang='ran'</script>"
                "<img src='data:,' onerror=\"document.documentElement.lang='ran'\">");
    const support::Outcome seen = support::browse(m_scratch, m_scratch.write("altered.html", page));
    std::size_t stopped = 0;
    for (std::size_t at = 0; (at = seen.error.find("CONSOLE", at)) != seen.error.npos; ++at) {
        ++stopped;
    }
    EXPECT_EQ(stopped, 3u) << seen.error;
    for (const char* part :
         {R"(<html lang="en")", R"(<h2 id="word">Failed</h2>)",
          R"(<p id="sentence">1 of 2 criteria are above tolerance.</p>)",
          R"(<li>Solid cyan: 4.75 ΔE00, 1.75 above the tolerance of 3.00</li>)",
          R"(<h1 id="title">Größe "7" &lt;/script&gt;&lt;script&gt;hostile()&lt;/script&gt;)",
          R"(<li>2 patches &lt;svg onload=hostile()&gt; have no counterpart.</li>)",
          R"(<dd>'"&gt;&lt;img src=x onerror=hostile()&gt;</dd>)",
          R"(">=2+5 "&gt;&lt;img src=x onerror=hostile()&gt; (100&nbsp;0&nbsp;0&nbsp;0)</td>)",
          R"(<output id="range">1–4 of 4</output>)"}) {
        EXPECT_THAT(seen.output, HasSubstr(part));
    }
    for (const char* part : {"<img src=\"x", "<svg onload"}) {
        EXPECT_THAT(seen.output, Not(HasSubstr(part)));
    }

    // The worst patch is first in the table, with both its colours and all its numbers.
    const std::size_t table = seen.output.find("<tbody>", seen.output.find("id=\"patches\""));
    const std::string first = seen.output.substr(table, seen.output.find("</tr>", table) - table);
    for (const char* part : {"<td class=\"patch\">=2+5 <span class=\"name\">", "100 0 0 0",
                             "55.00 -37.00 -50.00", "52.00 -35.00 -46.00", ">-3.00<", ">+2.00<",
                             ">+4.00<", "difference\">4.75</td>", "beyond what an sRGB screen"}) {
        EXPECT_THAT(first, HasSubstr(part));
    }
}

TEST_F(Viewer, NamesWhatTheServerDoesNotHave) {
    support::RunOptions options = withoutDisplay();
    options.environment.insert({"TMPDIR", m_scratch.path()});
    const std::string file =
        m_scratch.path("tintgate-failed-writes-" + std::to_string(geteuid()) + ".txt");
    const auto shown = [&](const std::vector<const char*>& times) {
        std::string lines = "no line of ours\n";
        for (const char* time : times) {
            lines +=
                std::string(time) + "\t/srv/<b>\tjob/7\tRemote/Measurement/Date\tit was lost\n";
        }
        m_scratch.write(file.substr(m_scratch.path().size() + 1), lines);
        std::filesystem::remove(m_page);
        EXPECT_EQ(show(options).exitCode, 0);
        return support::contentsOf(m_page);
    };
    // The meta file's run was at 10:34:56 UTC, its measurement half an hour earlier.
    const utimbuf made = {0, 1'714'557'600}; // 10:00 UTC
    const std::string sample = m_folder + "/Measured sample.txt";
    const char* const within[] = {"2024-05-01T10:00:00Z", "2024-05-01T10:34:57Z"};
    EXPECT_THAT(shown({within[0]}), Not(HasSubstr("failed, first"))) << "nothing was measured";
    std::ofstream(sample).close();
    utime(sample.c_str(), &made);
    EXPECT_THAT(shown({"2024-05-01T09:59:59Z", "2024-05-01T10:34:58Z"}),
                Not(HasSubstr("failed, first")));
    EXPECT_THAT(shown({within[0], "2024-05-01T10:34:58Z"}), HasSubstr("1 write failed, first"));
    const std::string page = shown({within[0], within[1]});
    EXPECT_THAT(page, HasSubstr("does not have all of this result: 2 writes failed, first job/7 "
                                "Remote/Measurement/Date (it was lost)."));
    EXPECT_THAT(page, Not(HasSubstr("/srv/<b>")));
}

TEST_F(Viewer, SortsFindsAndSavesPatches) {
    ASSERT_EQ(show().exitCode, 0);
    const support::Outcome seen = support::browseHandled(m_scratch, m_page, R"(
        const ids = () => [...document.querySelectorAll("td.patch")].map((cell) =>
            cell.firstChild.data.trim()).join("|");
        const heading = (i) => document.querySelectorAll("#patches th button")[i];
        seen("worst", ids());
        for (const [name, column] of [["best", 8], ["labels", 0], ["lighter", 5]]) {
            heading(column).click();
            seen(name, ids());
        }
        for (const words of ["100 0 0 0", "PAPER"]) {
            find(words);
            seen(words, ids());
        }
        find("nothing");
        seen("none", text("range"));
        HTMLAnchorElement.prototype.click = () => {};
        URL.createObjectURL = (blob) => { blob.text().then((text) => seen("csv", text)); return ""; };
        document.getElementById("csv").click();)");
    EXPECT_THAT(seen.error, Not(HasSubstr("CONSOLE")));
    for (const char* part :
         {"[worst: =2+5|row 3|A1|A4]", "[best: A4|A1|row 3|=2+5]", "[labels: =2+5|A1|A4|row 3]",
          "[lighter: A1|row 3|=2+5|A4]", "[100 0 0 0: =2+5]", "[PAPER: A1]", "[none: None found]",
          "id,name,CMYK_C,CMYK_M,CMYK_Y,CMYK_K,target_L,target_a,target_b,measured_L,measured_a,"
          "measured_b,difference,measured_id,measured_name",
          "\nA1,paper,0,0,0,0,95,0,-2,95,0.5,-3,1.25,A1,paper",
          "\n'=2+5,\"\"\"&gt;&lt;img src=x "
          "onerror=hostile()&gt;\",100,0,0,0,55,-37,-50,52,-35,-46,4.75",
          "\n,,0,0,100,0,89,-5,93,88,-4,90,1.5", "\nA4,,0,0,0,100,16,0,0,,0,0,,A4,\r\n"}) {
        EXPECT_THAT(seen.output, HasSubstr(part));
    }
}

TEST_F(Viewer, PrintsTheHeadingOfPatchesOnEachSheet) {
    std::string result = support::contentsOf(data + "output.json");
    const std::string row = "[\"A1\",\"paper\",[0,0,0,0],[95,0,-2],[95,0.5,-3],1.25],\n";
    ASSERT_NE(result.find(row), result.npos);
    for (int i = 0; i < 90; ++i) {
        result.insert(result.find(row), row);
    }
    std::ofstream(m_folder + "/output.json") << result;
    ASSERT_EQ(show().exitCode, 0);
    std::istringstream sheets(support::printed(m_scratch, m_page));
    int withPatches = 0;
    for (std::string sheet; std::getline(sheets, sheet, '\f');) {
        if (sheet.find("95.00 0.50 -3.00") != sheet.npos) {
            ++withPatches;
            EXPECT_THAT(sheet, HasSubstr("Measured L*a*b*"));
        }
    }
    EXPECT_GE(withPatches, 2);
}

// Results in the current format: patches with other labels on the sheet, and warnings.
TEST_F(Viewer, ShowsWhereAPatchIsOnTheSheetAndWhatIsInDoubt) {
    std::string result = support::contentsOf(data + "output.json");
    const auto change = [&](const std::string& from, const std::string& to) {
        ASSERT_NE(result.find(from), result.npos) << from;
        result.replace(result.find(from), from.size(), to);
    };
    change("[88,-4,90],1.5]", "[88,-4,90],1.5,\"B3\",\"<b>Gelb\"]");
    change("\"verdict\": \"failed\"", "\"verdict\": \"incomplete\"");
    change("\"used\":true,\"outcome\":\"fail\"", "\"used\":false,\"outcome\":\"fail\"");
    change("have no counterpart.\"", "have no counterpart.\",\"keepsOpen\":true");
    change("\"illuminationCondition\":-1",
           "\"illuminationCondition\":2,\"conditionRequired\":true");
    change("\"statistics\"", "\"repeats\": {\"patches\":1,\"readings\":2,\"meanDistance\":0.4,"
                             "\"largestDistance\":0.5,\"worstPatch\":2},\n\"statistics\"");
    m_scratch.write("Größe a b/output.json", result);
    ASSERT_EQ(show().exitCode, 0);
    const support::Outcome seen = support::browseHandled(m_scratch, m_page, R"(
        seen("columns", [...document.querySelectorAll("#patches th button")].map((button) =>
            button.textContent).slice(0, 2).join("|"));
        find("gelb");
        seen("cells", [...document.querySelectorAll("#patches tbody td.patch")].map((cell) =>
            cell.textContent).join("|"));)");
    EXPECT_THAT(seen.error, Not(HasSubstr("CONSOLE")));
    for (const char* part : {"[columns: On the sheet|In the target]",
                             "[cells: B3 &lt;b&gt;Gelb|row 3]", "the comparison itself is in doubt",
                             "<li>2 patches &lt;svg onload=hostile()&gt; have no "
                             "counterpart.</li>",
                             "measurement not stated, target M1, preset requires M2</dd>",
                             "1 patch, 2 readings; each is compared by itself",
                             "0.50 ΔE00, B3 &lt;b&gt;Gelb (0&nbsp;0&nbsp;100&nbsp;0)"}) {
        EXPECT_THAT(seen.output, HasSubstr(part));
    }
}

TEST_F(Viewer, ListsAPageARunAndPassesOverWhatIsNone) {
    const std::string job = m_scratch.makeFolder("Tintgate") + "/JobID_7";
    std::filesystem::rename(m_folder, job);
    support::RunOptions options = withoutDisplay();
    options.environment["TMPDIR"] = m_scratch.path();
    for (int times = 0; times < 2; ++times) {
        EXPECT_EQ(support::run({VIEWER, "-meta", job + "/meta.json"}, options).exitCode, 0);
    }
    m_scratch.write("Tintgate/JobID_7/report-strip1-broken.html", "<html>");
    std::filesystem::create_symlink(pageName, job + "/report-link.html");
    ASSERT_EQ(support::run({VIEWER}, options).exitCode, 0);
    const support::Outcome seen =
        support::browse(m_scratch, m_scratch.path("Tintgate/reports.html"));
    EXPECT_THAT(seen.error, Not(HasSubstr("CONSOLE")));
    EXPECT_THAT(seen.output, HasSubstr("1 report in " + m_scratch.path("Tintgate")));
    EXPECT_THAT(seen.output, HasSubstr("<a href=\"./JobID_7/" + pageName + "\">Größe \"7\" &lt;"));
}

TEST_F(Viewer, OpensThePageWhereThereIsADisplay) {
    const std::string opener =
        m_scratch.write("xdg-open",
                        // The viewer and the browser outlive the terminal.
                        "#!/bin/sh\nkill -HUP $$\nprintf '%s' \"$*\" > \"$OPENED.part\" && mv "
                        "\"$OPENED.part\" \"$OPENED\"\n");
    std::filesystem::permissions(opener, std::filesystem::perms::owner_all);
    const std::string opened = m_scratch.path("opened");
    support::RunOptions options = withoutDisplay();
    options.environment["WAYLAND_DISPLAY"] = ":7";
    options.environment["PATH"] = m_scratch.path() + ":/usr/bin:/bin";
    options.environment["OPENED"] = opened;
    EXPECT_EQ(show(options).exitCode, 0);
    ASSERT_TRUE(awaitFile(opened));
    EXPECT_EQ(support::contentsOf(opened), m_page);
    options.environment["PATH"] = m_folder;
    std::swap(options.environment["DISPLAY"], options.environment["WAYLAND_DISPLAY"]);
    const support::Outcome outcome = show(options);
    EXPECT_EQ(outcome.exitCode, 7);
    EXPECT_THAT(outcome.error, HasSubstr("xdg-open"));
    EXPECT_TRUE(support::exists(m_page));
}

/// A job's folder, and a system root with settings of the viewer.
class ViewerWithLabels : public Viewer {
  protected:
    support::Outcome showWith(const std::string& settings) const {
        m_scratch.write("root/etc/tintgate/viewer.conf", settings);
        support::RunOptions options = withoutDisplay();
        options.environment["TINTGATE_ROOT"] = m_scratch.path("root");
        return show(options);
    }

    const std::string m_stem = m_page.substr(0, m_page.size() - 5);
};

TEST_F(ViewerWithLabels, HasThemMadeInASessionOfTheirOwnFromWhatThePageShows) {
    const std::string program = m_scratch.write(
        "label program",
        "#!/bin/sh\ncd '" + m_scratch.path() +
            "'\nwhile [ ! -e replaced ]; do sleep 0.02; done\ncat >result; cat /dev/fd/3 >meta\n"
            "cut -d')' -f2 /proc/$$/stat | cut -d' ' -f5 >session; echo $$ >process\n"
            "echo trouble >&2\n"
            "printf '%s\\n' \"$@\" >words.part; mv words.part words\n");
    std::filesystem::permissions(program, std::filesystem::perms::owner_all);
    const support::Outcome shown =
        showWith("\xEF\xBB\xBF# a comment\nlabel = png\n  label-size = 62x100 \r\nlabel-dpi=203\n"
                 "certificate = yes\nsheet = A4\nwhen = always\npaper = Matt = 235 g\n"
                 "operator = -q\nprogram = " +
                 program + "\n");
    EXPECT_EQ(shown.exitCode, 0) << shown.error;
    EXPECT_TRUE(support::exists(m_page)) << "before the program ends, which waits";
    // The next run of the job replaces the files while the program has not read them.
    std::filesystem::rename(m_folder + "/output.json", m_scratch.path("output.json"));
    std::filesystem::rename(m_folder + "/meta.json", m_scratch.path("meta.json"));
    m_scratch.write("replaced", "");
    ASSERT_TRUE(awaitFile(m_scratch.path("words")));
    EXPECT_EQ(support::contentsOf(m_scratch.path("words")),
              "-\n--meta=/dev/fd/3\n--label=" + m_stem + ".label.png\n--pdf=" + m_stem +
                  ".pdf\n--label-size=62x100\n--label-dpi=203\n--sheet=A4\n"
                  "--label-field=paper=Matt = 235 g\n--label-field=operator=-q\n");
    EXPECT_EQ(support::contentsOf(m_scratch.path("result")),
              support::contentsOf(data + "output.json"));
    EXPECT_EQ(support::contentsOf(m_scratch.path("meta")), support::contentsOf(data + "meta.json"));
    EXPECT_EQ(support::contentsOf(m_scratch.path("session")),
              support::contentsOf(m_scratch.path("process")));
    EXPECT_EQ(support::contentsOf(m_stem + ".label.log"), "trouble\n");
}

TEST_F(ViewerWithLabels, MakesThemOfTheJobsThatAreToHaveThem) {
    const std::string program = "program = " TINTGATE_REPORT "\n";
    EXPECT_EQ(showWith("label = pdf\nwhen = passed\n" + program).exitCode, 0);
    EXPECT_EQ(showWith("# nothing\n" + program).exitCode, 0);
    EXPECT_FALSE(support::exists(m_stem + ".label.log")) << "the job failed";
    std::string fields;
    for (const char* name : {"calibrated", "colourants", "condition", "instrument", "intent",
                             "operator", "paper", "printer", "profile", "software", "workflow"}) {
        fields += std::string(name) + " = text\n"; // What either program does not know, it refuses.
    }
    EXPECT_EQ(showWith("label = svg\ncertificate = yes\n" + fields + program).exitCode, 0);
    ASSERT_TRUE(awaitFile(m_stem + ".pdf"));
    EXPECT_THAT(support::contentsOf(m_stem + ".label.svg"), HasSubstr("<svg"));
    EXPECT_THAT(support::contentsOf(m_stem + ".pdf"), HasSubstr("%PDF"));
}

TEST_F(ViewerWithLabels, ShowsThePageEvenIfItsSettingsAreWrong) {
    struct {
        std::string settings;
        const char* words;
    } const cases[] = {
        {"label = pdf\nlabel = pdf\n", "line 2 has label a second time"},
        {"label pdf\n", "line 1 has no ="},
        {"\nlabel = gif\n", "line 2 expects pdf, svg, png or no for label"},
        {"colour = red\n", "line 1 names \"colour\", which is not a setting"},
        {"when = failed\n", "line 1 expects always or passed for when"},
        {"sheet =\n", "line 1 expects A4 or Letter for sheet"},
        {std::string("label\0= pdf", 11), "can't be read as text"},
        {"label = pdf\nprogram = /nonexistent/program\n", "/nonexistent/program: No such file"},
    };
    for (const auto& [settings, words] : cases) {
        std::filesystem::remove(m_page);
        const support::Outcome shown = showWith(settings);
        EXPECT_EQ(shown.exitCode, 8) << settings;
        EXPECT_THAT(shown.error, HasSubstr(words));
        EXPECT_TRUE(support::exists(m_page));
    }
}

TEST_F(Viewer, SaysWhatIsWrongAndLeavesNoPage) {
    const std::string meta = m_folder + "/meta.json";
    const std::string result = m_folder + "/output.json";
    const auto expectFailure = [&](int exitCode, unsigned user = 0) {
        support::RunOptions options = withoutDisplay();
        options.user = user;
        const support::Outcome outcome = show(options);
        EXPECT_EQ(outcome.exitCode, exitCode);
        EXPECT_EQ(std::count(outcome.error.begin(), outcome.error.end(), '\n'), 1) << outcome.error;
        EXPECT_FALSE(support::exists(m_page));
    };
    std::filesystem::permissions(m_scratch.path(), std::filesystem::perms(0755));
    std::filesystem::permissions(m_folder, std::filesystem::perms(0555));
    expectFailure(6, support::ordinaryUser);
    std::filesystem::permissions(m_folder, std::filesystem::perms(0755));
    m_scratch.write("Größe a b/output.json", "{}");
    expectFailure(5);
    std::filesystem::remove(result);
    expectFailure(4);
    m_scratch.write("Größe a b/meta.json", "{\"format\":");
    expectFailure(3);
    std::filesystem::remove(meta);
    expectFailure(2);
    for (const char* word : {"-detail", "-meta", "-meta-detail"}) {
        EXPECT_EQ(support::run({VIEWER, word}, withoutDisplay()).exitCode, 64) << word;
    }
}

} // namespace
