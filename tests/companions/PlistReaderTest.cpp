// SPDX-License-Identifier: Apache-2.0
#include <string>

#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

support::Outcome print(const std::string& command, const std::string& path) {
    return support::run({PLIST_READER, "-c", command, path});
}

// Another program writes the lists, in both forms.
TEST(PlistReader, PrintsOneValueOrNothing) {
    const struct {
        const char* command;
        int exitCode;
        const char* output = "";
    } cases[] = {
        {"Print :'Nerova Hue Workbench':library_path", 0,
         "/opt/\"quoted\" $(exit) `x` 'y' \\z \xc3\xbc; & |\n"},
        {"Print \"a:b\"", 0, "colon\n"},
        {"  Print  :a\\:b", 0, "colon\n"},
        {"Print :John's", 0, "-7\n"},
        {"Print :list:1:second", 0, "inside\n"},
        {"Print :empty", 0, "\n"},
        {"Print :missing", 1},
        {"Print :list", 1},
        {"Print :list:2", 1},
        {"Print :bytes", 1},
        {"Print :'open", 64},
        {"Delete :empty", 64},
        {"", 64},
    };
    for (const std::string form : {"xml", "bin"}) {
        for (const auto& [command, exitCode, output] : cases) {
            SCOPED_TRACE(form + ' ' + command);
            const auto outcome =
                print(command, TINTGATE_SOURCE_DIR "/tests/data/plist/values." + form + ".plist");
            EXPECT_EQ(outcome.output + outcome.error, output);
            EXPECT_EQ(outcome.exitCode, exitCode);
        }
    }
}

TEST(PlistReader, RefusesWhatIsNoPropertyList) {
    const support::ScratchFolder folder;
    const std::string whole =
        support::contentsOf(TINTGATE_SOURCE_DIR "/tests/data/plist/values.bin.plist");
    for (const std::string& path :
         {folder.path("missing"), folder.path(), folder.write("xml", "<plist><dict><key>a</key>"),
          folder.write("cut", whole.substr(0, whole.size() / 2))}) {
        EXPECT_EQ(print("Print :empty", path).exitCode, 2) << path;
    }
}

} // namespace
