#include <string>

#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

support::Outcome print(const std::string& command, const std::string& path) {
    return support::run({PLIST_READER, "-c", command, path});
}

class PlistReader : public testing::TestWithParam<const char*> {
  protected:
    const std::string m_list = std::string(TINTGATE_SOURCE_DIR "/tests/data/plist/") + GetParam();
};

// The lists come from another writer, in both forms.
INSTANTIATE_TEST_SUITE_P(Forms, PlistReader,
                         testing::Values("values.xml.plist", "values.bin.plist"));

TEST_P(PlistReader, PrintsOneValueAndNothingElse) {
    const struct {
        const char* command;
        const char* value;
    } cases[] = {
        {"Print :'Nerova Hue Workbench':library_path",
         "/opt/\"quoted\" $(exit) `x` 'y' \\z \xc3\xbc; & |"},
        {"Print \"a:b\"", "colon"},
        {"  Print  :a\\:b", "colon"},
        {"Print :John's", "-7"},
        {"Print :real", "0.1"},
        {"Print :yes", "true"},
        {"Print :date", "2024-02-29T12:00:00Z"},
        {"Print :list:1:second", "inside"},
        {"Print :empty", ""},
    };
    for (const auto& [command, value] : cases) {
        const support::Outcome outcome = print(command, m_list);
        EXPECT_EQ(outcome.output, std::string(value) + "\n") << command;
        EXPECT_EQ(outcome.exitCode, 0) << command;
    }
}

TEST_P(PlistReader, IsSilentWhereThereIsNoValue) {
    const struct {
        const char* command;
        int exitCode;
    } cases[] = {
        {"Print :missing", 1}, {"Print :list", 1},
        {"Print :list:2", 1},  {"Print :list:first", 1},
        {"Print :bytes", 1},   {"Print :empty:more", 1},
        {"Print", 1},          {"Print :'open", 64},
        {"Print :'a'b", 64},   {"Printer :empty", 64},
        {"Delete :empty", 64}, {"", 64},
    };
    for (const auto& [command, exitCode] : cases) {
        const support::Outcome outcome = print(command, m_list);
        EXPECT_EQ(outcome.exitCode, exitCode) << command;
        EXPECT_EQ(outcome.output + outcome.error, "") << command;
    }
}

TEST(PlistReaderFiles, RefusesWhatIsNoPropertyList) {
    const support::ScratchFolder folder;
    const std::string whole =
        support::contentsOf(TINTGATE_SOURCE_DIR "/tests/data/plist/values.bin.plist");
    for (const std::string& path :
         {folder.path("missing"), folder.makeFolder("folder"), folder.write("empty", ""),
          folder.write("xml", "<plist><dict><key>a</key>"),
          folder.write("cut", whole.substr(0, whole.size() / 2))}) {
        EXPECT_EQ(print("Print :empty", path).exitCode, 2) << path;
    }
}

} // namespace
