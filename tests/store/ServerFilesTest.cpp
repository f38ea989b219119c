// SPDX-License-Identifier: Apache-2.0
#include "store/sqlite/ServerFiles.h"

#include <filesystem>

#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utime.h>

#include "StoreTest.h"

using store::Fault;

namespace {

class ServerFiles : public StoreTest {
  protected:
    /// Expects that the path can't be read or written, and that no file is left.
    void expectRefused(const std::string& path) {
        SCOPED_TRACE(path.substr(0, 60));
        const auto before = engine->files().size();
        EXPECT_EQ(faultOf([&] { file(*engine, path); }), Fault::BadPath);
        EXPECT_EQ(faultOf([&] { putFile(*engine, path, "hostile"); }), Fault::BadPath);
        EXPECT_EQ(engine->files().size(), before);
    }

    using StoreTest::StoreTest;
    const std::unique_ptr<store::StoreEngine> engine = open();
};
ON_BOTH_ENGINES(ServerFiles);

class FilesInFolder : public ServerFiles {
  protected:
    FilesInFolder() : ServerFiles(Engine::Sqlite) {}
};

} // namespace

TEST_P(ServerFiles, PathsStayBelowTheFilesWhateverTheyContain) {
    putFile(*engine, "inside/file", "x");
    std::string deep = "x";
    for (int i = 0; i < 1'100; ++i) {
        deep += "/a";
    }
    for (const std::string& path :
         {std::string("../secret"), std::string("inside/../../secret"),
          std::string("inside/../inside/file"), std::string(".."), std::string("/"),
          std::string("."), std::string(), std::string("inside"), std::string("inside/file/"),
          std::string("inside/file/more"), std::string("inside/file\0.txt", 16),
          std::string(256, 'a'), deep, std::string(".tintgate-versions/inside/file/.tintgate-1"),
          std::string("inside/.tintgate-new-1-0")}) {
        expectRefused(path);
    }
    EXPECT_EQ(faultOf([&] { file(*engine, "missing/file"); }), Fault::NoFile);

    // Absolute paths are read as paths below the folder of files. Names may contain any bytes.
    putFile(*engine, "//opt/server/./ControlCharts/a\\b \xFF\n.it8", "chart");
    EXPECT_EQ(file(*engine, "opt/server/ControlCharts/a\\b \xFF\n.it8"), "chart");
    EXPECT_EQ(engine->files().back().path, "opt/server/ControlCharts/a\\b \xFF\n.it8");
    std::string large(1'000'003, 'x'); // Several pieces on a server.
    large.replace(262'100, 100, "where one ends");
    for (const std::string& text : {large, large.substr(0, 524'288)}) {
        putFile(*engine, "large", text);
        EXPECT_EQ(file(*engine, "large"), text);
    }
}

TEST_F(FilesInFolder, NoLinkLeadsOut) {
    folder.write("secret", "secret");
    const std::string outside = folder.makeFolder("outside");
    symlink(outside.c_str(), (address + "/files/out").c_str());
    symlink(folder.path("secret").c_str(), (address + "/files/link").c_str());
    symlink(".", (address + "/files/round").c_str());
    mkfifo((address + "/files/pipe").c_str(), 0666);
    for (const char* path : {"out/file", "link", "round/inside/file", "pipe"}) {
        expectRefused(path);
    }
    EXPECT_EQ(support::contentsOf(folder.path("secret")), "secret");
    EXPECT_TRUE(std::filesystem::is_empty(outside));
}

TEST_P(ServerFiles, KeepsEachVersionUntilItIsPruned) {
    const std::string path = "jobs/7/job.jdf";
    using Texts = std::vector<std::string>;
    EXPECT_EQ(versions(*engine, path), Texts());
    for (const std::string text : {"one", "two!", "three", "three", ""}) {
        putFile(*engine, path, text);
    }
    EXPECT_EQ(versions(*engine, path), (Texts{"one", "two!", "three", "three"}));
    engine->restoreVersion(path, 2);
    EXPECT_EQ(file(*engine, path), "two!");
    EXPECT_EQ(versions(*engine, path), (Texts{"one", "two!", "three", "three", ""}));
    EXPECT_EQ(faultOf([&] { engine->restoreVersion(path, 9); }), Fault::NoFile);

    EXPECT_EQ(engine->pruneVersions(path, {.keepNewest = 2}), 3);
    putFile(*engine, path, "last");
    EXPECT_EQ(versions(*engine, path), (Texts{"three", "", "two!"}));
    EXPECT_EQ(engine->versions(path).back().number, 6) << "numbers are not used twice";
    // A path that could be taken for one of the file's versions.
    putFile(*engine, path + ".d/1", "below");
    EXPECT_EQ(engine->pruneVersions(path, {.keepNewest = 0}), 3);
    EXPECT_EQ(file(*engine, path), "last");
    EXPECT_EQ(file(*engine, path + ".d/1"), "below");
    EXPECT_EQ(engine->files().size(), 2u);
}

TEST_F(FilesInFolder, LeftoversGoWhileDeliveriesStay) {
    putFile(*engine, "a/file", "x");
    const std::string left = folder.write("store/files/a/.tintgate-new-1-1", "half");
    EXPECT_EQ(engine->removeLeftovers(), 0) << "it may be a delivery that just began";
    const utimbuf old = {1, 1};
    utime(left.c_str(), &old);
    EXPECT_EQ(engine->files().size(), 1u);
    folder.makeFolder("store/files/.tintgate-versions/b");
    const std::string copied =
        folder.write("store/files/.tintgate-versions/b/.tintgate-new-1-1", "by a copy");
    utime(copied.c_str(), &old);
    EXPECT_EQ(engine->removeLeftovers(), 2);
    EXPECT_FALSE(support::exists(left));
    EXPECT_FALSE(support::exists(copied));

    // As after a process that was killed between keeping a version and replacing the file.
    std::filesystem::create_directories(address + "/files/.tintgate-versions/a/file");
    std::filesystem::create_hard_link(address + "/files/a/file",
                                      address + "/files/.tintgate-versions/a/file/.tintgate-1");
    EXPECT_TRUE(engine->versions("a/file").empty());
    putFile(*engine, "a/file", "y");
    EXPECT_EQ(versions(*engine, "a/file"), std::vector<std::string>{"x"});
}

TEST_P(ServerFiles, FoldersMayBeAsDeepAsPathsAreLong) {
    std::string deep;
    for (int i = 0; i < 1'023; ++i) {
        deep += "a/";
    }
    const rlimit limit = {1'024, 1'024}; // The limit of many accounts.
    rlimit before;
    getrlimit(RLIMIT_NOFILE, &before);
    setrlimit(RLIMIT_NOFILE, &limit);
    if (!room) { // Faster than waiting for the disk at each folder.
        support::run({"python3", "-c",
                      "import os, sys\n"
                      "os.chdir(sys.argv[1])\n"
                      "for i in range(1023):\n    os.mkdir('a')\n    os.chdir('a')",
                      address + "/files"});
    }
    putFile(*engine, deep + "b", "deep");
    putFile(*engine, "a/a/b", "x");
    std::vector<std::string> paths;
    for (const auto& entry : engine->files()) {
        paths.push_back(entry.path);
    }
    EXPECT_EQ(paths, (std::vector<std::string>{deep + "b", "a/a/b"}));
    EXPECT_EQ(engine->removeLeftovers(), 0);
    EXPECT_EQ(file(*engine, deep + "b"), "deep");
    setrlimit(RLIMIT_NOFILE, &before);
}

TEST_F(FilesInFolder, AFolderThatCannotBeReadIsNamed) {
    putFile(*engine, "a/open", "x");
    putFile(*engine, "a/closed/file", "x");
    const std::string closed = address + "/files/a/closed";
    const pid_t child = startProcess([&] {
        chmod(closed.c_str(), 0);
        if (geteuid() == 0) { // Root may read any folder.
            const auto mine = [](const std::string& path) { return chown(path.c_str(), 1, 1); };
            for (const char* each : {"", "/files", "/files/a", "/files/a/closed"}) {
                EXPECT_EQ(mine(address + each), 0);
            }
            EXPECT_EQ(setegid(1) | seteuid(1), 0);
        }
        try {
            engine->files();
        } catch (const store::StoreFailure& failure) {
            EXPECT_EQ(failure.status, Fault::ReadOnly);
            EXPECT_STREQ(failure.what(), "server path \"a/closed\": Permission denied");
            return HasFailure() ? 1 : 0;
        }
        return 2;
    });
    EXPECT_EQ(endOf(child), 0);
}

TEST_F(FilesInFolder, PermissionsAreThoseOfTheStoresFolderWhateverTheUmask) {
    for (const mode_t mode : {02770U, 0750U, 0700U, 02777U}) {
        const std::string path = folder.makeFolder("s" + std::to_string(mode));
        chmod(path.c_str(), mode);
        const mode_t former = umask(027);
        store::makeStore(path, "x");
        {
            const auto made = store::openStore(path);
            made->create(3, 1);
            for (const char* text : {"1", "2"}) {
                umask(mode % 2 == 0 ? 077 : 0);
                putFile(*made, "a/b", text);
            }
            for (const char* each : {"/files", "/files/a", "/files/.tintgate-versions/a/b"}) {
                EXPECT_EQ(support::modeOf(path + each), mode & 02770) << each << std::oct << mode;
            }
            for (const char* each : {"/files/a/b", "/files/.tintgate-versions/a/b/.tintgate-1",
                                     "/tickets.db", "/tickets.db-wal", "/tickets.db-shm"}) {
                EXPECT_EQ(support::modeOf(path + each), mode & 0660) << each << std::oct << mode;
            }
        }
        umask(former);
    }
}
