#include "comgui/ServerFiles.h"

#include <filesystem>

#include <sys/stat.h>
#include <unistd.h>
#include <utime.h>

#include "StoreTest.h"

using store::Fault;

namespace {

class ServerFiles : public StoreTest {
  protected:
    const std::unique_ptr<store::StoreEngine> engine = open();
};
ON_BOTH_ENGINES(ServerFiles);

class FilesInFolder : public FolderStoreTest {
  protected:
    const std::unique_ptr<store::StoreEngine> engine = open();
};

} // namespace

TEST_P(ServerFiles, PathsStayBelowTheFilesWhateverTheyContain) {
    putFile(*engine, "inside/file", "x");
    const std::string longPart(256, 'a');
    std::string deep;
    for (int i = 0; i < 1'100; ++i) {
        deep += "a/";
    }
    const std::pair<std::string, Fault> cases[] = {
        {"../secret", Fault::BadPath},
        {"inside/../../secret", Fault::BadPath},
        {"inside/../inside/file", Fault::BadPath},
        {"..", Fault::BadPath},
        {"", Fault::BadPath},
        {"/", Fault::BadPath},
        {".", Fault::BadPath},
        {"inside", Fault::BadPath},
        {"inside/", Fault::BadPath},
        {"inside/file/", Fault::BadPath},
        {"inside/file/more", Fault::BadPath},
        {std::string("inside/file\0.txt", 16), Fault::BadPath},
        {longPart, Fault::BadPath},
        {std::string(10'240, 'a'), Fault::BadPath},
        {deep + "x", Fault::BadPath},
        {".tintgate-versions/inside/file/.tintgate-1", Fault::BadPath},
        {"inside/.tintgate-new-1-0", Fault::BadPath},
    };
    for (const auto& [path, fault] : cases) {
        const std::string shown = path.substr(0, 60);
        EXPECT_EQ(faultOf([&, at = path] { file(*engine, at); }), fault) << shown;
        EXPECT_EQ(faultOf([&, at = path] { putFile(*engine, at, "hostile"); }), fault) << shown;
    }
    EXPECT_EQ(faultOf([&] { file(*engine, "missing/file"); }), Fault::NoFile);
    ASSERT_EQ(engine->files().size(), 1u) << "what was refused left something";

    // Absolute paths mean the same below the files, and names of any bytes are names.
    putFile(*engine, "//opt/server/./ControlCharts/a\\b \xFF\n.it8", "chart");
    EXPECT_EQ(file(*engine, "opt/server/ControlCharts/a\\b \xFF\n.it8"), "chart");
    EXPECT_EQ(engine->files().back().path, "opt/server/ControlCharts/a\\b \xFF\n.it8");
    std::string large(1'000'003, 'x'); // Of several pieces, where there are pieces.
    large.replace(262'100, 100, "where one ends");
    putFile(*engine, "large", large);
    EXPECT_EQ(file(*engine, "large"), large);
    putFile(*engine, "large", large.substr(0, 524'288));
    EXPECT_EQ(file(*engine, "large"), large.substr(0, 524'288));
}

TEST_F(FilesInFolder, NoLinkLeadsOut) {
    folder.write("secret", "secret");
    const std::string outside = folder.makeFolder("outside");
    symlink(outside.c_str(), (address + "/files/out").c_str());
    symlink(folder.path("secret").c_str(), (address + "/files/link").c_str());
    symlink(".", (address + "/files/round").c_str());
    mkfifo((address + "/files/pipe").c_str(), 0666);
    for (const std::string path : {"out/file", "link", "round/inside/file", "pipe"}) {
        EXPECT_EQ(faultOf([&] { file(*engine, path); }), Fault::BadPath) << path;
        EXPECT_EQ(faultOf([&] { putFile(*engine, path, "hostile"); }), Fault::BadPath) << path;
    }
    EXPECT_EQ(support::contentsOf(folder.path("secret")), "secret");
    EXPECT_TRUE(std::filesystem::is_empty(outside));
    EXPECT_TRUE(engine->files().empty());
    putFile(*engine, "/opt/chart.it8", "chart");
    EXPECT_EQ(support::contentsOf(address + "/files/opt/chart.it8"), "chart");
}

TEST_P(ServerFiles, KeepsEachVersionUntilItIsPruned) {
    const std::string path = "jobs/7/job.jdf";
    EXPECT_TRUE(engine->versions(path).empty());
    for (const std::string text : {"one", "two!", "three", "three", ""}) {
        putFile(*engine, path, text);
    }
    EXPECT_EQ(file(*engine, path), "");
    const auto texts = [&] {
        std::string all;
        for (const auto& version : engine->versions(path)) {
            std::ostringstream to;
            engine->getVersion(path, version.number, to);
            EXPECT_EQ(to.str().size(), version.size);
            all += std::to_string(version.number) + "=" + to.str() + " ";
        }
        return all;
    };
    EXPECT_EQ(texts(), "1=one 2=two! 3=three 4=three ");
    engine->restoreVersion(path, 2);
    EXPECT_EQ(file(*engine, path), "two!");
    EXPECT_EQ(texts(), "1=one 2=two! 3=three 4=three 5= ");
    EXPECT_EQ(faultOf([&] { engine->restoreVersion(path, 9); }), Fault::NoFile);

    // A path below a file's versions, and a file where a folder of versions is.
    putFile(*engine, "jobs/7/job.jdf.d/1", "below");
    EXPECT_EQ(engine->pruneVersions(path, 2), 3);
    EXPECT_EQ(texts(), "4=three 5= ");
    putFile(*engine, path, "last");
    EXPECT_EQ(texts(), "4=three 5= 6=two! ");
    EXPECT_EQ(engine->pruneVersions(path, 0), 3);
    EXPECT_EQ(file(*engine, path), "last");

    std::string listed;
    for (const auto& entry : engine->files()) {
        listed += entry.path + ":" + std::to_string(entry.size) + " ";
    }
    EXPECT_EQ(listed, "jobs/7/job.jdf:4 jobs/7/job.jdf.d/1:5 ");
}

TEST_F(FilesInFolder, LeftoversGoWhileDeliveriesStay) {
    putFile(*engine, "a/file", "x");
    const std::string left = folder.write("store/files/a/.tintgate-new-1-1", "half");
    EXPECT_EQ(engine->removeLeftovers(), 0) << "it may be a delivery that just began";
    const utimbuf old = {1, 1};
    utime(left.c_str(), &old);
    EXPECT_EQ(engine->files().size(), 1u);
    EXPECT_EQ(engine->removeLeftovers(), 1);
    EXPECT_FALSE(support::exists(left));
    EXPECT_EQ(file(*engine, "a/file"), "x");

    // A process that was killed after it had kept a version, and before the exchange.
    std::filesystem::create_directories(address + "/files/.tintgate-versions/a/file");
    std::filesystem::create_hard_link(address + "/files/a/file",
                                      address + "/files/.tintgate-versions/a/file/.tintgate-1");
    EXPECT_TRUE(engine->versions("a/file").empty());
    putFile(*engine, "a/file", "y");
    EXPECT_EQ(engine->versions("a/file").size(), 1u);
}
