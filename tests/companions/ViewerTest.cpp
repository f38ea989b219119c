#include <algorithm>
#include <filesystem>
#include <fstream>
#include <string>
#include <unistd.h>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Browse.h"
#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

using testing::HasSubstr;
using testing::Not;

const std::string data = TINTGATE_SOURCE_DIR "/tests/data/report/";
const std::string pageName = "report-strip2-2024-05-01-123456.html";

support::RunOptions withoutDisplay() {
    support::RunOptions options;
    options.environment = {{"DISPLAY", std::nullopt}, {"WAYLAND_DISPLAY", std::nullopt}};
    return options;
}

/// A job's folder, its name with blanks and a sign outside ASCII, holding both files of a run.
class Viewer : public testing::Test {
  protected:
    Viewer() {
        m_scratch.makeFolder("Größe a b");
        for (const char* name : {"meta.json", "output.json"})
            std::filesystem::copy_file(data + name, m_folder + "/" + name);
    }

    support::Outcome show(const support::RunOptions& options = withoutDisplay()) const {
        return support::run(
            {VIEWER, "-detail", "-meta", m_scratch.path("Größe"), "a", "b/meta.json"}, options);
    }

    support::Outcome browse(const std::string& page) const {
        return support::browse(page, m_scratch.path("browser"));
    }

    const support::ScratchFolder m_scratch;
    const std::string m_folder = m_scratch.path("Größe a b");
};

TEST_F(Viewer, ShowsTheVerdictAndRunsNothingOfATicket) {
    ASSERT_EQ(show().exitCode, 0);
    const support::Outcome seen = browse(m_folder + "/" + pageName);
    EXPECT_THAT(seen.error, Not(HasSubstr("CONSOLE")));
    for (const char* part :
         {R"(<h2 id="word">Failed</h2>)",
          R"(<p id="sentence">1 of 2 criteria are above tolerance.</p>)",
          R"(<li>Solid cyan: 4.75 ΔE00, 1.75 above the tolerance of 3.00</li>)",
          R"(<h1 id="title">Größe "7" &lt;/script&gt;&lt;script&gt;hostile()&lt;/script&gt;)",
          R"(<p>2 patches &lt;svg onload=hostile()&gt; have no counterpart.</p>)",
          R"(<dd>'"&gt;&lt;img src=x onerror=hostile()&gt;</dd>)",
          R"(<td>=2+5 "&gt;&lt;img src=x onerror=hostile()&gt; (100&nbsp;0&nbsp;0&nbsp;0)</td>)",
          R"(<output id="range">1–4 of 4</output>)"})
        EXPECT_THAT(seen.output, HasSubstr(part));
    EXPECT_THAT(seen.output, Not(HasSubstr("<img")));
    EXPECT_THAT(seen.output, Not(HasSubstr("<svg")));

    // The worst patch leads the table, with both its colours and all its numbers.
    const std::size_t table = seen.output.find("<tbody>", seen.output.find("id=\"patches\""));
    const std::string first = seen.output.substr(table, seen.output.find("</tr>", table) - table);
    for (const char* part : {"<td class=\"patch\">=2+5 <span class=\"name\">", "100 0 0 0",
                             "55.00 -37.00 -50.00", "52.00 -35.00 -46.00", ">-3.00<", ">+2.00<",
                             ">+4.00<", "difference\">4.75</td>", "beyond what an sRGB screen"})
        EXPECT_THAT(first, HasSubstr(part));
}

TEST_F(Viewer, ItsPolicyStopsWhatIsNotThePagesOwn) {
    ASSERT_EQ(show().exitCode, 0);
    std::string page = support::contentsOf(m_folder + "/" + pageName);
    page.insert(page.find("<header>"),
                "<script>document.documentElement.lang='ran'</script>"
                "<img src='data:,' onerror=\"document.documentElement.lang='ran'\">");
    const support::Outcome seen = browse(m_scratch.write("altered.html", page));
    EXPECT_THAT(seen.output, HasSubstr("<html lang=\"en\""));
    EXPECT_THAT(seen.output, HasSubstr("<h2 id=\"word\">Failed</h2>"));
    EXPECT_THAT(seen.error, HasSubstr("Content Security Policy"));
}

// A person's hand: a script in the page, which its policy has to let in for once.
TEST_F(Viewer, SortsFindsAndSavesPatches) {
    ASSERT_EQ(show().exitCode, 0);
    std::string page = support::contentsOf(m_folder + "/" + pageName);
    const std::size_t policy = page.find("<meta http-equiv=\"Content-Security-Policy\"");
    page.erase(policy, page.find('\n', policy) - policy);
    page.insert(page.rfind("</body>"), R"(<script>
        const seen = (name, text) => { document.body.append(`\n[${name}: ${text}]\n`); };
        const ids = () => [...document.querySelectorAll("td.patch")].map((cell) =>
            cell.firstChild.data.trim()).join("|");
        const heading = (i) => document.querySelectorAll("#patches th button")[i];
        const find = (text) => {
            document.getElementById("find").value = text;
            document.getElementById("find").dispatchEvent(new Event("input"));
        };
        seen("worst", ids());
        heading(8).click();
        seen("best", ids());
        heading(0).click();
        seen("labels", ids());
        heading(5).click();
        seen("lighter", ids());
        find("100 0 0 0");
        seen("device", ids());
        find("PAPER");
        seen("name", ids());
        find("nothing");
        seen("none", document.getElementById("range").textContent);
        HTMLAnchorElement.prototype.click = () => {};
        URL.createObjectURL = (blob) => { blob.text().then((text) => seen("csv", text)); return ""; };
        document.getElementById("csv").click();
    </script>)");
    const support::Outcome seen = browse(m_scratch.write("handled.html", page));
    EXPECT_THAT(seen.error, Not(HasSubstr("CONSOLE")));
    for (const char* part :
         {"[worst: =2+5|row 3|A1|A4]", "[best: A4|A1|row 3|=2+5]", "[labels: =2+5|A1|A4|row 3]",
          "[lighter: A1|row 3|=2+5|A4]", "[device: =2+5]", "[name: A1]", "[none: None found]",
          "id,name,CMYK_C,CMYK_M,CMYK_Y,CMYK_K,target_L,target_a,target_b,measured_L,measured_a,"
          "measured_b,difference",
          "\nA1,paper,0,0,0,0,95,0,-2,95,0.5,-3,1.25",
          "\n'=2+5,\"\"\"&gt;&lt;img src=x "
          "onerror=hostile()&gt;\",100,0,0,0,55,-37,-50,52,-35,-46,4.75",
          "\n,,0,0,100,0,89,-5,93,88,-4,90,1.5", "\nA4,,0,0,0,100,16,0,0,,0,0,\r\n"})
        EXPECT_THAT(seen.output, HasSubstr(part));
}

TEST_F(Viewer, ListsReportsAndPassesOverWhatIsNone) {
    const std::string job = m_scratch.makeFolder("Tintgate") + "/JobID_7";
    std::filesystem::rename(m_folder, job);
    ASSERT_EQ(support::run({VIEWER, "-meta", job + "/meta.json"}, withoutDisplay()).exitCode, 0);
    m_scratch.write("Tintgate/JobID_7/report-strip1-broken.html", "<html>");
    std::filesystem::create_symlink(pageName, job + "/report-link.html");

    support::RunOptions options = withoutDisplay();
    options.environment["TMPDIR"] = m_scratch.path();
    const support::Outcome outcome = support::run({VIEWER}, options);
    ASSERT_EQ(outcome.exitCode, 0) << outcome.error;
    const support::Outcome seen = browse(m_scratch.path("Tintgate/reports.html"));
    EXPECT_THAT(seen.error, Not(HasSubstr("CONSOLE")));
    EXPECT_THAT(seen.output, HasSubstr("1 report in " + m_scratch.path("Tintgate")));
    EXPECT_THAT(seen.output, HasSubstr("<a href=\"./JobID_7/" + pageName + "\">Größe \"7\" &lt;"));
}

TEST_F(Viewer, KeepsOnePageARun) {
    ASSERT_EQ(show().exitCode, 0);
    ASSERT_EQ(show().exitCode, 0);
    const std::string second = m_folder + "/report-strip2-2024-05-01-123456-2.html";
    EXPECT_FALSE(support::exists(second));
    std::string text = support::contentsOf(m_folder + "/output.json");
    text.replace(text.find("1.25"), 4, "1.26");
    m_scratch.write("Größe a b/output.json", text);
    ASSERT_EQ(show().exitCode, 0);
    EXPECT_TRUE(support::exists(second));
}

TEST_F(Viewer, OpensThePageWhereThereIsADisplay) {
    const std::string opener = m_scratch.write(
        "xdg-open",
        "#!/bin/sh\nprintf '%s' \"$*\" > \"$OPENED.part\" && mv \"$OPENED.part\" \"$OPENED\"\n");
    std::filesystem::permissions(opener, std::filesystem::perms::owner_all);
    for (const char* display : {"DISPLAY", "WAYLAND_DISPLAY"}) {
        const std::string opened = m_scratch.path(std::string("opened-") + display);
        support::RunOptions options = withoutDisplay();
        options.environment[display] = ":7";
        options.environment["PATH"] = m_scratch.path() + ":/usr/bin:/bin";
        options.environment["OPENED"] = opened;
        EXPECT_EQ(show(options).exitCode, 0);
        for (int waited = 0; waited < 1000 && !support::exists(opened); ++waited)
            usleep(10'000);
        EXPECT_EQ(support::contentsOf(opened), m_folder + "/" + pageName);
    }
    support::RunOptions options = withoutDisplay();
    options.environment["DISPLAY"] = ":7";
    options.environment["PATH"] = m_folder;
    const support::Outcome outcome = show(options);
    EXPECT_EQ(outcome.exitCode, 7);
    EXPECT_THAT(outcome.error, HasSubstr("xdg-open"));
    EXPECT_TRUE(support::exists(m_folder + "/" + pageName));
}

TEST_F(Viewer, SaysWhatIsWrongAndLeavesNoPage) {
    const std::string meta = m_folder + "/meta.json";
    const std::string result = m_folder + "/output.json";
    const std::string goodMeta = support::contentsOf(meta);
    const std::string goodResult = support::contentsOf(result);
    const struct {
        const char* metaText;
        const char* resultText; ///< Null: missing; empty: the good one.
        int exitCode;
    } cases[] = {{nullptr, "", 2}, {"{\"format\":", "", 3}, {"", nullptr, 4}, {"", "{}", 5}};
    const auto put = [](const std::string& path, const char* text, const std::string& good) {
        std::filesystem::remove(path);
        if (text != nullptr)
            std::ofstream(path, std::ios::binary) << (*text != '\0' ? text : good);
    };
    for (const auto& [metaText, resultText, exitCode] : cases) {
        put(meta, metaText, goodMeta);
        put(result, resultText, goodResult);
        const support::Outcome outcome = show();
        EXPECT_EQ(outcome.exitCode, exitCode);
        EXPECT_EQ(std::count(outcome.error.begin(), outcome.error.end(), '\n'), 1) << outcome.error;
        EXPECT_FALSE(support::exists(m_folder + "/" + pageName));
    }

    put(meta, "", goodMeta);
    put(result, "", goodResult);
    std::filesystem::permissions(m_scratch.path(), std::filesystem::perms(0755));
    std::filesystem::permissions(m_folder, std::filesystem::perms(0555));
    support::RunOptions ordinary = withoutDisplay();
    ordinary.user = support::ordinaryUser;
    EXPECT_EQ(show(ordinary).exitCode, 6);
    EXPECT_FALSE(support::exists(m_folder + "/" + pageName));

    for (const std::vector<std::string>& words : std::vector<std::vector<std::string>>{
             {VIEWER, "-detail"}, {VIEWER, "-meta"}, {VIEWER, meta}, {VIEWER, "-meta-detail"}})
        EXPECT_EQ(support::run(words, withoutDisplay()).exitCode, 64) << words.back();
}

} // namespace
