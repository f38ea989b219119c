// SPDX-License-Identifier: Apache-2.0
// The administration tool as its callers see it, and the store after each call.

#include <bit>
#include <filesystem>
#include <limits>
#include <numeric>
#include <random>
#include <regex>
#include <sstream>
#include <string>
#include <vector>

#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "Postgres.h"
#include "StoreProgram.h"
#include "TicketText.h"
#include "store/KeyBytes.h"
#include "store/StoreEngine.h"
#include "store/Users.h"

namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::Not;

store::TicketContent contentOf(const std::string& records) {
    store::TicketContent content;
    content.apply(support::RecordTable(records).records());
    return content;
}

/// For each type, the values that a conversion is most likely to lose.
store::TicketContent awkwardContent() {
    store::TicketContent content =
        contentOf("special=0.0,-0.0,inf,-inf,nan holes[0]=1 holes[3]='x holes[4]='y "
                  "holes[16777215]=2 numbers=-2147483648,u2147483648,l-9223372036854775808,"
                  "l9007199254740993,U18446744073709551615,7,u7,l7,U7,7.0,p0,p18446744073709551615 "
                  "texts=','\x01\x1f\"\\/\x7f,'\xf0\x9f\x8e\xa8,'\xed\xa0\x80,'a\xff "
                  "\x80key_that_is_no_UTF-8\xff=1 \xc3\xbc/\x01\"key\"='x");
    auto doubles = std::make_shared<store::Elements>();
    std::mt19937_64 random(4711);
    for (int i = 0; i < 2000; ++i) { // Including NaNs with payloads.
        const auto bits = random() | (i % 50 == 0 ? 0x7FF0000000000000 : 0);
        doubles->put(i, std::bit_cast<double>(bits));
    }
    doubles->put(2000, std::numeric_limits<double>::denorm_min());
    content.put("doubles", doubles);
    std::string everyByte(256, '\0');
    std::iota(everyByte.begin(), everyByte.end(), '\0');
    auto binaries = std::make_shared<store::Elements>();
    for (const int length : {0, 1, 255, 256}) {
        binaries->put(binaries->count(),
                      store::Binary{std::make_shared<store::Bytes>(everyByte.substr(0, length))});
    }
    content.put("binaries", binaries);
    return content;
}

std::string bytesOf(const store::TicketContent& content) {
    std::string bytes;
    for (const auto& [key, elements] : content.keys()) {
        bytes += key + '\n' + store::keyBytes(*elements) + '\n';
    }
    return bytes;
}

class TintgateStore : public StoreProgram {
  protected:
    std::unique_ptr<store::StoreEngine> open() const { return store::openStore(m_address); }

    void makeTicket(int type, int id, const store::TicketContent& content) const {
        const auto engine = open();
        engine->create(type, id);
        engine->change(type, id, store::Scope{.everything = true},
                       [&](store::TicketContent& stored) { stored.transfer(content, true); });
    }
};

TEST_F(TintgateStore, ExportAndImportKeepEveryBit) {
    const auto content = awkwardContent();
    makeTicket(3, 7, content);
    makeTicket(49, 0xFFFFFF, {});
    const std::string file = m_folder.path("all.json");
    answer({"export", "-o", file});
    const auto valid =
        support::run({"python3", "-c",
                      "import json, jsonschema, sys\n"
                      "schema, tickets = [json.load(open(path)) for path in sys.argv[1:]]\n"
                      "jsonschema.Draft202012Validator(schema).validate(tickets)",
                      TINTGATE_SOURCE_DIR "/docs/ticket.schema.json", file});
    EXPECT_EQ(valid.exitCode, 0) << valid.error;

    answer({"ticket", "delete", "job/7"});
    answer({"key", "set", "49/16777215", "To be gone", "int", "1"});
    EXPECT_EQ(answer({"import", file}), "Imported 3 tickets\n");
    EXPECT_TRUE(bytesOf(*open()->content(3, 7, store::KeyFilter())) == bytesOf(content));
    EXPECT_TRUE(open()->content(49, 0xFFFFFF, store::KeyFilter())->empty());

    const auto merged = m_folder.write("t.json", R"({"format": "tintgate tickets", "version": 1,
            "tickets": [{"type": 3, "id": 7, "keys": {"numbers": {"int": 9}}}]})");
    answer({"import", "--merge", merged});
    EXPECT_EQ(answer({"key", "get", "job/7", "numbers"}), "9\n");
    EXPECT_EQ(answer({"key", "get", "job/7", "holes", "--position", "4"}), "y\n");
}

TEST_F(TintgateStore, BrokenFilesChangeNothing) {
    const std::string before = answer({"export"});
    const auto ticket = [](const std::string& members) {
        return R"({"format": "tintgate tickets", "version": 1, "tickets": [
            {"type": 3, "id": 1, "keys": {"fine": {"int": 1}}}, {)" +
               members + "}]}";
    };
    const auto key = [&](const std::string& elements) {
        return ticket(R"("type": 3, "id": 2, "keys": {"k": )" + elements + "}");
    };
    const std::pair<std::string, const char*> cases[] = {
        {key(R"({"int": 1})").substr(0, 150), "not JSON"},
        {R"({"format": "tintgate tickets", "version": 2, "tickets": []})", "\"version\""},
        {R"({"format": "tintgate tickets", "version": 1, "tickets": {}})", "is not a list"},
        {ticket(R"("type": 3, "id": 18446744073709551617, "keys": {})"), "16777215"},
        {ticket(R"("type": 3, "id": 1, "keys": {})"), "job/1 is repeated"},
        {ticket(R"("type": 3, "id": 2, "keys": {"a": {"int": 1}, "a": {"int": 1}})"),
         "is repeated"},
        {key(R"({"int": 2147483648})"), "job/2, key \"k\": 2147483648 is not of type int"},
        {key(R"({"string": "a\u0000b"})"), "zero byte"},
        {key(R"({"at": 16777215, "int": [3, 4]})"), "more elements than"},
    };
    for (const auto& [contents, words] : cases) {
        expectRefusal({"import", m_folder.write("broken.json", contents)}, 3, words);
    }
    const auto fine = m_folder.write("fine.json", key(R"({"int": 1})"));
    expectRefusal({"import", fine, m_folder.write("broken.json", "{}")}, 3, "broken.json: ");
    EXPECT_EQ(answer({"export"}), before);
    answer({"import", fine}); // The rest of these files is valid.
}

TEST_F(TintgateStore, UsersLogInAsTheySay) {
    const auto add = [&](const std::string& name, const std::string& password) {
        return run({"user", "add", name, "--password-file", m_folder.write("secret", password)})
            .exitCode;
    };
    const auto login = [&](const char* name, const std::string& password) {
        return store::checkLogin(*open(), name, password);
    };
    std::string longest;
    for (int i = 0; i < 127; ++i) {
        longest += "\xc3\xbf"; // U+00FF, the last character that is one byte in a login.
    }
    EXPECT_EQ(add("anna", longest), 0);
    EXPECT_EQ(add("anna", "other"), 2);
    EXPECT_EQ(login("anna", std::string(127, '\xff')), store::LoginAnswer::Welcome);
    for (const std::string& refused :
         {std::string("\xc4\x80"), std::string(128, 'a'), std::string("a:b")}) {
        EXPECT_EQ(add(refused, "p"), 3) << refused;
        EXPECT_EQ(add("b", refused), 3) << refused;
    }

    const std::string zoe = "Zo\xc3\xab";
    EXPECT_EQ(add(zoe, "p\xc3\xa4ss word\r\nsecond line\n"), 0);
    EXPECT_EQ(login("Zo\xeb", "p\xe4ss word"), store::LoginAnswer::Welcome);
    answer({"user", "disable", zoe});
    answer({"user", "password", zoe, "--password-file", m_folder.write("new", "new\n")});
    EXPECT_EQ(login("Zo\xeb", "new"), store::LoginAnswer::Disabled);
    EXPECT_EQ(answer({"user", "list"}), "NAME  STATE\nZo\xc3\xab   disabled\nanna  enabled\n");
    answer({"user", "enable", zoe});
    EXPECT_EQ(login("Zo\xeb", "new"), store::LoginAnswer::Welcome);
    answer({"user", "remove", zoe});
    open()->putUser({"an:na", "", false}); // Made by an earlier version. It can only be removed.
    answer({"user", "remove", "an:na"});
    expectRefusal({"user", "enable", zoe}, 1, "there is no user");
}

TEST_F(TintgateStore, PasswordsAreNotShownOnATerminal) {
    // Answers both prompts of "user add" on a pseudo-terminal. Returns what the terminal showed.
    const auto addByHand = [this](const std::string& password, const std::string& again) {
        return support::run({"python3", "-c",
                             "import os, pty, sys\n"
                             "answers = iter(sys.argv[1:3])\n"
                             "def shown(terminal):\n"
                             "    text = os.read(terminal, 1000)\n"
                             "    if text.endswith(b': '):\n"
                             "        os.write(terminal, next(answers).encode() + b'\\n')\n"
                             "    return text\n"
                             "sys.exit(os.waitstatus_to_exitcode(pty.spawn(sys.argv[3:], shown)))",
                             password, again, TINTGATE_STORE_PROGRAM, "-s", m_address, "user",
                             "add", "anna"});
    };
    EXPECT_EQ(addByHand("secret", "secreT").exitCode, 3);
    const support::Outcome outcome = addByHand("secret", "secret");
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_THAT(outcome.output, AllOf(HasSubstr(": "), Not(HasSubstr("secret"))));
    EXPECT_EQ(store::checkLogin(*open(), "anna", "secret"), store::LoginAnswer::Welcome);
}

TEST_F(TintgateStore, KeysAreSetReadAndDeleted) {
    answer({"ticket", "create", "job/7"});
    const std::pair<std::vector<std::string>, std::string> steps[] = {
        {{"int", "-5", "3"}, R"({"int":[-5,3]})"},
        {{"string", "[a,b]", "add", "--append"}, R"([{"int":[-5,3]},{"string":["[a,b]","add"]}])"},
        {{"double", "-Infinity", "-0.0", "1e-310", "NaN"},
         R"({"double":["-Infinity",-0.0,1e-310,"NaN"]})"},
        {{"binary", "YWI="}, R"({"binary":"YWI="})"},
        {{"int", "1", "--position", "2"}, R"([{"binary":"YWI="},{"at":2,"int":1}])"},
    };
    for (const auto& [arguments, expected] : steps) {
        std::vector<std::string> command = {"key", "set", "job/7", "K"};
        command.insert(command.end(), arguments.begin(), arguments.end());
        answer(command);
        EXPECT_EQ(answer({"key", "get", "job/7", "K", "--json"}), expected + "\n");
    }
    answer({"key", "delete", "job/7", "K", "--position", "0"});
    EXPECT_EQ(answer({"--json", "key", "get", "job/7", "K"}), "{\"at\":1,\"int\":1}\n");
    expectRefusal({"key", "delete", "job/7", "K", "--position", "2"}, 1, "so many elements");
    answer({"key", "delete", "job/7", "K"});
    expectRefusal({"key", "get", "job/7", "K"}, 1, "has no key K");

    const std::string bytes("\0raw\xff", 5);
    answer({"key", "set", "job/7", "B", "binary", "--from", m_folder.write("raw", bytes)});
    EXPECT_EQ(answer({"key", "get", "job/7", "B", "--raw"}), bytes);
    answer({"key", "set", "job/7", "Escape", "string", "\x1b[2J"});
    EXPECT_THAT(answer({"key", "list", "job/7", "E"}), HasSubstr("\\x1B[2J"));
    EXPECT_EQ(answer({"key", "get", "job/7", "Escape"}), "\x1b[2J\n");
    const auto shown =
        support::run({"python3", "-c", "import pty, sys; pty.spawn(sys.argv[1:])",
                      TINTGATE_STORE_PROGRAM, "-s", m_address, "key", "get", "job/7", "Escape"});
    EXPECT_EQ(shown.output, "\\x1B[2J\r\n");
}

TEST_F(TintgateStore, FilesKeepTheirVersionsAndSayWhetherTheyAreXml) {
    const std::string path = "/jobs/7/a.jdf";
    const std::pair<const char*, bool> contents[] = {
        {"<?xml version=\"1.0\"?>\n<JDF xmlns:t=\"u\"><t:a/></JDF>\n   ", true},
        {"<JDF><t:a/></JDF>", false}, // The prefix is not declared.
        {"<JDF><a></JDF", false},
        {"\xef\xbb\xbf<JDF/>", true},
    };
    for (const auto& [text, wellFormed] : contents) {
        answer({"file", "put", m_folder.write("a", text), path});
    }
    const auto versions = json::parse(answer({"--json", "file", "versions", path}));
    ASSERT_EQ(versions.size(), std::size(contents));
    for (std::size_t i = 0; i < versions.size(); ++i) {
        EXPECT_EQ(versions[i]["wellFormed"], contents[i].second) << i;
    }
    answer({"file", "restore", path, "1"});
    const std::string target = m_folder.path("target");
    answer({"file", "get", path, target});
    expectRefusal({"file", "get", path, target, "--version", "99"}, 1);
    EXPECT_EQ(support::contentsOf(target), contents[0].first);
    EXPECT_THAT(answer({"file", "prune", "--all", "--keep", "1"}), HasSubstr("Removed 3 versions"));
    EXPECT_EQ(answer({"file", "get", path, "-", "--version", "4"}), contents[3].first);
    expectRefusal({"file", "put", target, "/a/../../out"}, 11, "names no file");
}

TEST_F(TintgateStore, JobsAreListedByTheirVerificationAndCanRunAgain) {
    const std::string measured = " Remote/Measurement/Status=1 Remote/Measurement/Approval=1 "
                                 "Remote/Measurement/Values/Decimal=2 ";
    const std::string closed = "Job/Display/Status=211 Remote/ShowInVerifier=0" + measured;
    std::pair<std::string, std::string> jobs[] = {
        {"Job/Display/Status=208", "waiting 208 - - -"},
        {"Job/Display/Status=208 Input/FileType=4096", "- 208 - - -"},
        {"Job/Display/Status=30 Remote/ShowInVerifier=1 Remote/Measurement/Status=1 "
         "General/ParentID=9",
         "waiting 30 measured - 9"},
        {"Job/Display/Status=212 Remote/Measurement/Approval=-1", "failed 212 - - -"},
        {closed + "General/ParentID=0", "passed 211 passed - -"},
        {"Job/Display/Status=208 Remote/ShowInVerifier=0 General/ParentID=5" + measured,
         "waiting 208 passed - 5"},
        {closed + "General/ParentID=5 Remote/Measurement2/Status=1 Remote/Measurement2/Approval=0",
         "passed 211 passed cut off 5"},
        {closed + "General/ParentID=4 Workflow/Verify/Active=3 Remote/Measurement2/Approval=0 "
                  "Remote/Measurement2/Values/PSDDecimal=1",
         "passed 211 passed failed 4"},
    };
    for (const auto& job : jobs) {
        makeTicket(3, static_cast<int>(&job - jobs) + 1, contentOf(job.first));
    }
    const auto expectList = [&] {
        std::string expected = "JOB TITLE STATE CODE STRIP 1 STRIP 2 PARENT\n";
        for (const auto& job : jobs) {
            expected += std::to_string(&job - jobs + 1) + " " + job.second + "\n";
        }
        // Ignores the blanks that align the columns.
        EXPECT_EQ(std::regex_replace(answer({"jobs"}), std::regex(" +"), " "), expected);
    };
    expectList();
    answer({"reset", "7", "--strip", "2"});
    jobs[6].second = "waiting 211 passed - 5";
    expectList();
    answer({"reset", "job/7", "--family"}); // Its parent, and the other jobs of that parent.
    jobs[4].second = "waiting 211 - - -";
    jobs[5].second = "waiting 208 - - 5";
    jobs[6].second = "waiting 211 - - 5";
    expectList();
    expectRefusal({"reset", "9"}, 1, "there is no job 9");
}

TEST_F(TintgateStore, AResetWarnsOfRunsThatCannotSucceed) {
    const std::string waits = "Job/Display/Status=208 ";
    const std::string strip = "Footer/ControlstripFile='abcd ";
    const std::string fine = waits + strip + "Workflow/Verify/MeasurementWorkflow=";
    const struct {
        std::string keys, words; ///< Empty if there is no warning.
    } cases[] = {
        {fine + "1 Remote/UsedICCProfile='p", ""},
        {fine + "3 Footer/ControlstripInputProfile='p", ""},
        {fine + "2 Workflow/Verify/CharacterizationData='d", ""},
        {fine + "4 Job/FromEsko=1", ""},
        {waits + "Footer/Dynstrip/UseDynstrip=1 Footer/Dynstrip/IT8='s", ""},
        {fine + "1", "strip 1: it has no profile as reference (Footer/ControlstripInputProfile"},
        {fine + "3 Remote/Measurement/Reference/Numpatches=1 Remote/UsedICCProfile='",
         "references in the ticket count only for a strip that is measured"},
        {fine + "2", "strip 1: it has no reference (Workflow/Verify/CharacterizationData)"},
        {fine + "4", "no reference (Workflow/Verify/MeasurementWorkflow)"},
        {fine + "1 Remote/UsedICCProfile='p Footer/ControlstripFile='abc",
         "strip 1: it has no control strip (Footer/ControlstripFile, Footer/Nesting/"},
        {fine + "1 Remote/UsedICCProfile='p Workflow/Verify/Active=3",
         "strip 2: it has no reference (Workflow/Verify/MeasurementWorkflow2)"},
        {fine + "1 Remote/UsedICCProfile='p Input/FileType=4096", "never verified"},
        {"Job/Display/Status=211 " + strip, "only a remeasure finds it"},
        {waits + "Footer/Dynstrip/UseDynstrip=1", "no control strip (Footer/Dynstrip/IT8)"},
    };
    for (const auto& [keys, words] : cases) {
        SCOPED_TRACE(keys);
        makeTicket(3, 7, contentOf(keys + " Remote/Measurement/Status=1"));
        const support::Outcome outcome = run({"reset", "7"});
        EXPECT_EQ(outcome.exitCode, 0);
        EXPECT_THAT(outcome.output, HasSubstr("removed Remote/Measurement/Status"));
        EXPECT_THAT(outcome.error, words.empty() ? testing::Eq(words)
                                                 : testing::Matcher<std::string>(HasSubstr(words)));
    }
}

TEST_F(TintgateStore, AStoreOfAGroupIsForAllItsMembersAndNobodyElse) {
    expectRefusal({"-s", m_folder.path("new"), "make", "--group", "no such group"}, 3, "no group");
    expectRefusal({"make", "--group", "games"}, 2, "exists");
    expectRefusal({"-s", "service", "make", "--group", "games"}, 64, "folder");
    if (geteuid() != 0) {
        GTEST_SKIP() << "only root can be several people";
    }
    const std::string store = m_folder.path("shared");
    answer({"-s", store, "make", "--group", "games"});
    std::filesystem::permissions(m_folder.path(), std::filesystem::perms(0755));
    const std::string file = m_folder.write("file", "text");
    std::filesystem::permissions(file, std::filesystem::perms(0644));
    // Runs it with this user and group id, and with a umask that grants nobody else anything.
    const auto as = [&](int user, const char* group, const std::string& words) {
        const std::string number = std::to_string(user);
        return support::run({"setpriv", "--reuid=" + number, "--regid=" + number,
                             std::string("--groups=") + group, "sh", "-c",
                             "umask 077; exec \"$0\" -s \"$1\" " + words, TINTGATE_STORE_PROGRAM,
                             store});
    };
    for (const int user : {4001, 4002}) {
        const std::string put = "file put " + file + " /";
        for (const std::string& words :
             {put + "a/b/file", put + std::to_string(user) + "/file",
              std::string("ticket create job"), std::string("key set system Note int 1")}) {
            const auto outcome = as(user, "games", words);
            EXPECT_EQ(outcome.exitCode, 0) << user << words << outcome.error;
        }
    }
    EXPECT_EQ(as(4002, "games", "file put " + file + " /4001/file").exitCode, 0);
    EXPECT_EQ(as(4001, "games", "file restore /a/b/file 1").exitCode, 0);
    EXPECT_EQ(as(4003, "4003", "info").exitCode, 4);
}

TEST_F(TintgateStore, SaysWhyItCannotGoOn) {
    expectRefusal({"make"}, 2);
    expectRefusal({"-s", m_folder.path("none"), "jobs"}, 4, "none");
    const std::string colon = m_folder.path("press:room");
    expectRefusal({"-s", colon, "make"}, 3, "after the last \":\"");
    expectRefusal({"copy", m_folder.path("store"), colon}, 3, "after the last \":\"");
    EXPECT_FALSE(std::filesystem::exists(colon));
    support::RunOptions full;
    full.outputPath = "/dev/full";
    EXPECT_EQ(run({"export"}, full).exitCode, 12);

    const auto warned = run({"-s", m_folder.makeFolder(std::string(128, 'd')) + "/store", "make"});
    EXPECT_EQ(warned.exitCode, 0);
    EXPECT_THAT(warned.error, HasSubstr("a job can use at most 127"));
    for (const char* command : {"make", "info"}) {
        EXPECT_EQ(run({"-s", m_folder.path("K\xC3\xB6ln"), command}).error, "");
        EXPECT_THAT(run({"-s",
                         m_folder.path("\xC5\x81\xC3\xB3"
                                       "d\xC5\xBA"),
                         command})
                        .error,
                    HasSubstr("characters that a job can't use"));
    }
}

TEST_F(TintgateStore, IsReadWhereItCannotBeWritten) {
    makeTicket(3, 7, awkwardContent());
    answer({"file", "put", m_folder.write("small", "old"), "chart"});
    const std::string much = m_folder.write("much", std::string(300'000, 'x'));
    const std::string exported = answer({"export"});
    support::RunOptions options;
    options.environment = {{"TINTGATE_STORE", m_address}};
    const auto expectReadOnly = [&](const std::vector<std::string>& start, int refusal) {
        const auto runThere = [&](std::vector<std::string> arguments) {
            arguments.insert(arguments.begin(), TINTGATE_STORE_PROGRAM);
            arguments.insert(arguments.begin(), start.begin(), start.end());
            return support::run(arguments, options);
        };
        EXPECT_EQ(runThere({"file", "put", much, "chart"}).exitCode, refusal);
        EXPECT_EQ(
            runThere({"key", "set", "job/7", "big", "string", std::string(120'000, 'x')}).exitCode,
            refusal);
        EXPECT_TRUE(runThere({"export"}).output == exported);
        EXPECT_EQ(runThere({"file", "get", "chart", "-"}).output, "old");
        EXPECT_EQ(runThere({"info"}).exitCode, 0);
    };
    expectReadOnly({"prlimit", "--fsize=100000"}, 8);
    EXPECT_EQ(open()->versions("chart").size(), 0u);

    const std::string mount = "mount -o bind,ro \"$TINTGATE_STORE\" \"$TINTGATE_STORE\" && ";
    const std::vector<std::string> mounted = {"unshare", "-m", "sh", "-c", mount + "\"$@\"", "sh"};
    auto probe = mounted;
    probe.emplace_back("true");
    if (const auto tried = support::run(probe, options); tried.exitCode != 0) {
        GTEST_SKIP() << "no mount of its own: " << tried.error;
    }
    expectReadOnly(mounted, 7);
}

/// The fixture's store is a folder. Its copy is a database.
class StoreCopy : public TintgateStore {
  protected:
    StoreCopy() {
        makeTicket(3, 7, awkwardContent());
        makeTicket(49, 0xFFFFFF, {});
        const auto engine = open();
        engine->create(3, 90);
        engine->remove(3, 90);
        engine->putUser({"J\xF6rg", store::passwordHash("x"), true});
        for (int i = 0; i < 1'000; ++i) {
            // Writes the files directly, because the store would wait for the disk at each.
            m_folder.write("store/files/" + std::to_string(i % 10) + "-\xFF/" + std::to_string(i),
                           std::string(i * 37U, 'x'));
        }
        for (const std::string content : {"one", "", "three", "four"}) {
            std::istringstream from(content);
            engine->putFile("jobs/7.jdf", from);
            from.seekg(0);
            engine->putFile("jobs/8.jdf", from);
        }
        engine->pruneVersions("jobs/7.jdf", {.keepNewest = 2}); // Numbers must not start at 1.
        engine->pruneVersions("jobs/8.jdf", {.keepNewest = 0});
    }

    /// The whole content of a store.
    std::string allOf(const std::string& address) const {
        const auto engine = store::openStore(address);
        std::ostringstream text;
        text << answer({"--store", address, "export"});
        for (const auto& user : engine->users()) {
            text << user.name << user.passwordHash << user.disabled << '\n';
        }
        for (const auto& file : engine->files()) {
            text << file.path << ' ' << file.size << ' ' << file.time << '\n';
            engine->getFile(file.path, text);
            for (const auto& version : engine->versions(file.path)) {
                text << version.number << ' ' << version.size << ' ' << version.time << '\n';
                engine->getVersion(file.path, version.number, text);
            }
        }
        return text.str();
    }

    const support::PostgresRoom room;
    const std::string back = m_folder.path("back");
};

TEST_F(StoreCopy, ThereAndBackIsTheSameToTheBit) {
    const std::string before = allOf(m_address);
    EXPECT_THAT(answer({"copy", m_address, "room"}),
                HasSubstr("3 tickets, 1002 files and 1 user\n"));
    EXPECT_TRUE(allOf("room") == before);
    answer({"copy", "room", back});
    EXPECT_TRUE(allOf(back) == before);
    for (const std::string& address : {m_address, std::string("room"), back}) {
        EXPECT_EQ(answer({"--store", address, "ticket", "create", "job"}), "job/91\n");
        const auto engine = store::openStore(address);
        for (const char* path : {"jobs/7.jdf", "jobs/8.jdf"}) {
            std::istringstream from("five");
            engine->putFile(path, from);
            EXPECT_EQ(engine->versions(path).back().number, 4) << address << ' ' << path;
        }
    }
    expectRefusal({"copy", m_address, "room"}, 2, "already");
    expectRefusal({"copy", m_folder.path("none"), m_folder.path("new")}, 4, "none");
    EXPECT_FALSE(support::exists(m_folder.path("new")));
}

TEST_F(StoreCopy, OneThatWasBrokenOffIsNoStoreAndIsFinishedByTheNext) {
    const std::string before = allOf(m_address);
    const std::pair<std::string, std::string> ways[] = {{m_address, "room"}, {"room", back}};
    for (const auto& [from, to] : ways) {
        int brokenOff = 0;
        for (int milliseconds = 40; milliseconds < 200 && brokenOff < 3; milliseconds += 20) {
            support::RunOptions options;
            options.limit = std::chrono::milliseconds(milliseconds);
            if (!run({"copy", from, to}, options).timedOut) {
                break;
            }
            ++brokenOff;
            expectRefusal({"--store", to, "info"}, 4);
            // The next copy must remove this ticket.
            try {
                store::openCopy(to)->create(3, 5);
            } catch (const store::StoreFailure& failure) {
                ASSERT_EQ(failure.status, store::Fault::Busy) << failure.what();
            }
        }
        EXPECT_GT(brokenOff, 0) << from;
        {
            const auto other = store::openCopy(to);
            expectRefusal({"copy", from, to}, 9, "somebody else");
        }
        answer({"copy", from, to});
        EXPECT_TRUE(allOf(to) == before) << to;
    }
}

} // namespace
