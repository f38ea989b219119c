// SPDX-License-Identifier: Apache-2.0
// What the administration tool removes from a store, and what it leaves.
#include <ctime>
#include <sstream>
#include <string>

#include "AnyStoreProgram.h"

namespace {

using testing::HasSubstr;

class StoreRemoval : public AnyStoreProgram {
  protected:
    static std::string jdfKeys(const std::string& name, const std::string& more = "") {
        return "System/Folders/Temp='/server//temp Output/Jdf/FileName='" + name + " " + more;
    }
};
ON_BOTH_ENGINES(StoreRemoval);

TEST_P(StoreRemoval, JobsGoWithWhatBelongsToThemAlone) {
    const auto engine = open();
    makeJob(*engine, 7, jdfKeys("7.jdf") + "Footer/ControlstripFile='abcd");
    makeJob(*engine, 8, jdfKeys("shared.jdf", "General/ParentID=20"));
    makeJob(*engine, 9, jdfKeys("nine.jdf", "General/ParentID=20"));
    makeJob(*engine, 20, "Remote/JDFName='/server/temp/shared.jdf");
    makeJob(*engine, 21, "Footer/ControlstripInputProfile='server/temp/7b.jdf");
    makeJob(*engine, 22, jdfKeys("7b.jdf") + "Remote/JDFName='/../out");
    const std::string strip = "server/ControlCharts/abcd.it8";
    for (const std::string path : {"server/temp/7.jdf", "server/temp/shared.jdf",
                                   "server/temp/nine.jdf", "server/temp/7b.jdf", strip.c_str()}) {
        putFile(*engine, path, "12345");
        putFile(*engine, path, "123");
    }
    const std::string before = allOf(*engine);
    const auto dry = jsonOf({"job", "delete", "7", "--dry-run"});
    EXPECT_TRUE(allOf(*engine) == before);
    auto done = jsonOf({"job", "delete", "job/7"});
    EXPECT_EQ(done["dryRun"], false);
    done["dryRun"] = true;
    EXPECT_EQ(done, dry);
    EXPECT_EQ(done["bytes"], 8);
    EXPECT_EQ(done["files"][0]["path"], "/server/temp/7.jdf");
    EXPECT_FALSE(engine->exists(3, 7));
    EXPECT_FALSE(engine->fileAt("server/temp/7.jdf"));
    EXPECT_TRUE(engine->fileAt(strip));

    // Job 20 names the same file, until it is deleted along with job 8.
    EXPECT_THAT(answer({"job", "delete", "8"}),
                HasSubstr("Another job names /server/temp/shared.jdf: it stays"));
    EXPECT_TRUE(engine->fileAt("server/temp/shared.jdf"));
    answer({"job", "delete", "--family", "9"});
    EXPECT_EQ(engine->ids(3), (std::vector<int>{21, 22}));
    EXPECT_FALSE(engine->fileAt("server/temp/shared.jdf"));
    answer({"job", "delete", "22"}); // Its JDF is another job's profile.
    EXPECT_TRUE(engine->fileAt("server/temp/7b.jdf"));

    expectRefusal({"job", "delete", "21", "7"}, 1, "there is no job 7");
    EXPECT_TRUE(engine->exists(3, 21));
    EXPECT_EQ(engine->createNext(3), 23) << "the number of a deleted job is not used again";
}

TEST_P(StoreRemoval, AFileThatIsRemovedLeavesNothing) {
    const auto engine = open();
    for (const std::string path : {"a/b/file", "a/b/other", "a/deep/er/file"}) {
        for (const char* const text : {"one", "two", "three"}) {
            putFile(*engine, path, text);
        }
    }
    engine->pruneVersions("a/b/file", {}); // Notes which numbers were used.
    putFile(*engine, "a/b/file", "four");
    expectRefusal({"file", "delete", "a/b/file", "a/none"}, 1, "there is no file /a/none");
    expectRefusal({"file", "delete", "a/b"}, 11);
    EXPECT_EQ(engine->files().size(), 3u);
    const auto freed = jsonOf({"file", "delete", "/a/b/file", "a/deep/er/file"});
    EXPECT_EQ(freed["bytes"], 5u + 4u + 3u + 3u + 5u);
    EXPECT_EQ(engine->files().size(), 1u);
    EXPECT_EQ(engine->versions("a/b/file").size(), 0u);
    putFile(*engine, "a/b/file", "new");
    EXPECT_EQ(engine->versions("a/b/file").size(), 0u);
    putFile(*engine, "a/b/file", "newer");
    EXPECT_EQ(engine->versions("a/b/file").back().number, 1);

    // Only what is still as it was known.
    const int known = engine->highestVersion("a/b/file");
    putFile(*engine, "a/b/file", "newest");
    EXPECT_FALSE(engine->removeFile("a/b/file", known));
    EXPECT_EQ(file(*engine, "a/b/file"), "newest");
    EXPECT_TRUE(engine->removeFile("a/b/file", known + 1));
    makeJob(*engine, 3, "key=1,2");
    const auto content = engine->content(3, 3, store::KeyFilter());
    makeJob(*engine, 3, "key=1,2,3");
    EXPECT_FALSE(engine->removeUnchanged(3, 3, *content));
    makeJob(*engine, 3, "key=1,2");
    EXPECT_TRUE(engine->removeUnchanged(3, 3, *content));
    EXPECT_FALSE(engine->removeUnchanged(3, 3, *content));

    answer({"file", "delete", "a/b/other"});
    if (room) {
        EXPECT_EQ(
            support::BarePostgres("room").run("SELECT (SELECT count(*) FROM tintgate.contents)"
                                              " + (SELECT count(*) FROM tintgate.pieces)"
                                              " + (SELECT count(*) FROM tintgate.versions)"),
            "0");
    } else {
        EXPECT_TRUE(std::filesystem::is_empty(address + "/files/.tintgate-versions"));
    }
}

TEST_P(StoreRemoval, VersionsArePrunedByNumberAndAge) {
    const auto engine = open();
    constexpr std::int64_t day = 86'400;
    const std::int64_t now = std::time(nullptr);
    // The third was written with a clock that went wrong: it keeps those behind it.
    const std::int64_t ages[] = {100, 90, 10, 80, 1};
    const auto place = [&](const std::string& path) {
        for (int number = 0; number <= 5; ++number) {
            std::istringstream from(std::string(10, 'x'));
            const std::int64_t time = now - (number == 0 ? 0 : ages[number - 1]) * day - 60;
            engine->placeVersion(path, {number, 0, time}, from);
        }
    };
    const struct {
        std::vector<std::string> options;
        std::size_t left;
    } cases[] = {
        {{"--older", "95d"}, 4},
        {{"--older", "30d"}, 3},
        {{"--older", "30d", "--keep", "4"}, 4},
        {{"--older", "0d", "--keep", "2"}, 2},
        {{"--keep", "5"}, 5},
        {{"--older", "0d"}, 0},
    };
    for (const auto& [options, left] : cases) {
        SCOPED_TRACE(testing::PrintToString(options));
        place("a/file");
        std::vector<std::string> command = {"file", "prune", "--all"};
        command.insert(command.end(), options.begin(), options.end());
        auto dry = command;
        dry.emplace_back("--dry-run");
        const std::string removes = std::to_string(5 - left) + " version" + (left == 4 ? "" : "s") +
                                    ": " + std::to_string((5 - left) * 10) + " bytes\n";
        EXPECT_EQ(answer(dry), "Would remove " + removes);
        EXPECT_EQ(engine->versions("a/file").size(), 5u);
        EXPECT_EQ(answer(command), "Removed " + removes);
        EXPECT_EQ(engine->versions("a/file").size(), left);
        EXPECT_EQ(engine->highestVersion("a/file"), 5);
    }
    expectRefusal({"file", "prune", "--all"}, 64, "--older");
    expectRefusal({"file", "prune", "--all", "--older", "30"}, 3, "90d");
}

} // namespace
