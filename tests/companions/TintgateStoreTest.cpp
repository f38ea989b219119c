// The administration tool as its callers see it, and what it then left in the store.

#include <bit>
#include <limits>
#include <map>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include <pty.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "Postgres.h"
#include "StoreProgram.h"
#include "comgui/KeyBytes.h"
#include "comgui/StoreEngine.h"
#include "comgui/Users.h"

namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::Not;

class TintgateStore : public StoreProgram {
  protected:
    TintgateStore() { store::makeStore(m_address, "Press room"); }

    std::unique_ptr<store::StoreEngine> open() const { return store::openStore(m_address); }

    void makeTicket(int type, int id, const store::TicketContent& content) const {
        const auto engine = open();
        engine->create(type, id);
        store::Scope all;
        all.everything = true;
        engine->change(type, id, all,
                       [&](store::TicketContent& stored) { stored.transfer(content, true); });
    }
};

std::shared_ptr<store::Elements> elementsOf(const std::vector<store::Value>& values) {
    auto elements = std::make_shared<store::Elements>();
    for (std::size_t i = 0; i < values.size(); ++i) {
        elements->put(static_cast<int>(i), values[i]);
    }
    return elements;
}

store::Value text(const std::string& bytes) {
    return store::Text{std::make_shared<store::Bytes>(bytes)};
}

store::Value binary(const std::string& bytes) {
    return store::Binary{std::make_shared<store::Bytes>(bytes)};
}

/// Of every type the values that a conversion is likeliest to lose.
store::TicketContent awkwardContent() {
    std::vector<store::Value> doubles;
    std::mt19937_64 random(4711);
    for (int i = 0; i < 2000; ++i) { // Among them not-a-numbers with payloads.
        const auto bits = random();
        doubles.push_back(std::bit_cast<double>(i % 50 == 0 ? bits | 0x7FF0000000000000 : bits));
    }
    for (const std::uint64_t bits :
         {0x0ULL, 0x8000000000000000ULL, 0x1ULL, 0x7FF0000000000000ULL, 0xFFF0000000000000ULL,
          0x7FF8000000000000ULL, 0xFFF8000000000000ULL}) {
        doubles.push_back(std::bit_cast<double>(bits));
    }
    std::string everyByte;
    for (int byte = 0; byte < 256; ++byte) {
        everyByte += static_cast<char>(byte);
    }
    using Int64 = std::numeric_limits<long long>;
    store::TicketContent content;
    content.put("doubles", elementsOf(doubles));
    content.put("numbers", elementsOf({std::numeric_limits<int>::min(), 1U << 31, Int64::min(),
                                       (1LL << 53) + 1, std::numeric_limits<unsigned long>::max(),
                                       7, 7U, 7LL, 7ULL, 7.0, static_cast<void*>(nullptr),
                                       reinterpret_cast<void*>(~std::uintptr_t{0})}));
    content.put("texts", elementsOf({text(""), text("\x01\x1f\"\\/\x7f"), text("\xf0\x9f\x8e\xa8"),
                                     text("\xed\xa0\x80"), text("a\xff")}));
    content.put("binaries", elementsOf({binary(""), binary("a"), binary(everyByte.substr(0, 255)),
                                        binary(everyByte)}));
    content.put("\x80 key that is no UTF-8 \xff", elementsOf({1}));
    content.put("\xc3\xbc/\n\"key\"", elementsOf({text("\n")}));
    auto holes = elementsOf({1});
    holes->put(3, text("x"));
    holes->put(4, text("y"));
    holes->put(store::highestPosition, 2);
    content.put("holes", holes);
    return content;
}

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
    const auto read = open()->content(3, 7, store::KeyFilter());
    ASSERT_NE(read, nullptr);
    ASSERT_EQ(read->keys().size(), content.keys().size());
    for (const auto& [key, elements] : content.keys()) {
        ASSERT_NE(read->find(key), nullptr) << key;
        EXPECT_EQ(store::keyBytes(*read->find(key)), store::keyBytes(*elements)) << key;
    }
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
    const auto byteKey = [&](const std::string& name) {
        return ticket(R"("type": 3, "id": 2, "keys": {"a": {"int": 1}}, "byteKeys": {")" + name +
                      R"(": {"int": 1}})");
    };
    const std::pair<std::string, const char*> cases[] = {
        {key(R"({"int": 1})").substr(0, 150), "no JSON"},
        {R"({"format": "tintgate tickets", "version": 2, "tickets": []})", "\"version\""},
        {R"({"format": "tintgate tickets", "version": 1, "tickets": [], "more": 1})", "more"},
        {R"({"format": "tintgate tickets", "version": 1})", "\"tickets\" is no list"},
        {ticket(R"("type": 3, "id": 18446744073709551617, "keys": {})"), "16777215"},
        {ticket(R"("type": 3, "id": 1, "keys": {})"), "job/1 stands there twice"},
        {ticket(R"("type": 3, "id": 2, "keys": {"a": {"int": 1}, "a": {"int": 1}})"), "twice"},
        {byteKey("YQ=="), "twice"},
        {byteKey("YQ="), "base64"},
        {ticket(R"("type": 3, "id": 2, "keys": {"a*": {"int": 1}})"), "a key is not empty"},
        {key(R"({"int": 1, "uint": 1})"), "no type"},
        {key(R"({"int": 2147483648})"), "job/2, key \"k\": 2147483648 is no int"},
        {key(R"({"int": 1.0})"), "1.0 is no int"},
        {key(R"({"uint64": "18446744073709551616"})"), "is no uint64"},
        {key(R"({"double": "NaN:7ff0000000000000"})"), "is no double"},
        {key(R"({"string": "a\u0000b"})"), "zero byte"},
        {key(R"({"string": {"base64": "YQB=" }})"), "is no string"},
        {key(R"([{"int": [1, 2]}, {"at": 1, "int": 3}])"), "a position from 2"},
        {key(R"({"at": 16777215, "int": [3, 4]})"), "more elements than"},
    };
    for (const auto& [contents, words] : cases) {
        expectRefusal({"import", m_folder.write("broken.json", contents)}, 3, words);
    }
    const auto fine = m_folder.write("fine.json", byteKey("Yg=="));
    expectRefusal({"import", fine, m_folder.write("broken.json", "{}")}, 3, "broken.json: ");
    EXPECT_EQ(answer({"export"}), before);
    answer({"import", fine}); // The frame of all these cases is not what was refused.
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
        longest += "\xc3\xbf"; // U+00FF, the last that is one byte of a login.
    }
    EXPECT_EQ(add("anna", longest), 0);
    EXPECT_EQ(add("anna", "other"), 2);
    EXPECT_EQ(login("anna", std::string(127, '\xff')), store::LoginAnswer::Welcome);
    for (const auto& refused :
         std::vector<std::string>{"", "\xc4\x80", "a\xff", "a\xc2\x80", std::string(128, 'a')}) {
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
    expectRefusal({"user", "enable", zoe}, 1, "there is no user");
}

/// Runs "user add" on a terminal of its own, types the lines as they are asked for, and returns all
/// that the terminal showed.
std::string typePasswords(const std::string& address, const std::vector<std::string>& lines,
                          int& status) {
    int terminal = -1;
    const pid_t child = forkpty(&terminal, nullptr, nullptr, nullptr);
    if (child == 0) {
        execl(TINTGATE_STORE_PROGRAM, "tintgate-store", "-s", address.c_str(), "user", "add",
              "anna", nullptr);
        _exit(127);
    }
    std::string shown;
    std::size_t typed = 0;
    char byte = 0;
    while (read(terminal, &byte, 1) == 1) {
        shown += byte;
        if (typed < lines.size() && shown.ends_with(": ")) {
            const std::string line = lines[typed++] + '\n';
            EXPECT_EQ(write(terminal, line.data(), line.size()), ssize_t(line.size()));
        }
    }
    waitpid(child, &status, 0);
    close(terminal);
    return shown;
}

TEST_F(TintgateStore, PasswordsAreNotShownOnATerminal) {
    int status = -1;
    EXPECT_THAT(typePasswords(m_address, {"secret", "secreT"}, status), HasSubstr("differ"));
    EXPECT_EQ(WEXITSTATUS(status), 3);
    EXPECT_THAT(typePasswords(m_address, {"secret", "secret"}, status), Not(HasSubstr("secret")));
    EXPECT_EQ(status, 0);
    EXPECT_EQ(store::checkLogin(*open(), "anna", "secret"), store::LoginAnswer::Welcome);
}

TEST_F(TintgateStore, KeysAreSetReadAndDeleted) {
    answer({"ticket", "create", "job/7"});
    const std::pair<std::vector<std::string>, std::string> steps[] = {
        {{"int", "-5", "3"}, R"({"int":[-5,3]})"},
        {{"string", "[a,b]", "add", "--append"}, R"([{"int":[-5,3]},{"string":["[a,b]","add"]}])"},
        {{"double", "2.5", "--position", "1"},
         R"([{"int":-5},{"double":2.5},{"string":["[a,b]","add"]}])"},
        {{"string", "--append", "--", "-x", "--json", "--"},
         R"([{"int":-5},{"double":2.5},{"string":["[a,b]","add","-x","--json","--"]}])"},
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

    expectRefusal({"key", "set", "job/7", "K*", "int", "1"}, 3, "does not end in *");
    expectRefusal({"key", "set", "job/8", "K", "int", "1"}, 1, "no ticket job/8");
    expectRefusal({"key", "set", "job/7", "K", "int"}, 64, "say the values");
}

TEST_F(TintgateStore, FilesKeepTheirVersionsAndSayWhetherTheyAreXml) {
    const std::string path = "/jobs/7/a.jdf";
    const std::pair<const char*, bool> contents[] = {
        {"<?xml version=\"1.0\"?>\n<JDF xmlns:t=\"u\"><t:a/></JDF>\n   ", true},
        {"<JDF><t:a/></JDF>", false}, // A prefix that stands for nothing.
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
    EXPECT_EQ(answer({"file", "prune", "--all", "--keep", "1"}), "Removed 3 versions\n");
    EXPECT_EQ(answer({"file", "get", path, "-", "--version", "4"}), contents[3].first);
    expectRefusal({"file", "put", target, "/a/../../out"}, 11, "names no file");
    expectRefusal({"file", "put", m_folder.path("missing"), "/a"}, 12, "can't be read");
}

/// Keys of a job that are all integers.
using Keys = std::map<std::string, int>;

store::TicketContent jobOf(const Keys& keys) {
    store::TicketContent content;
    for (const auto& [key, value] : keys) {
        content.put(key, elementsOf({value}));
    }
    return content;
}

constexpr const char* display = "Job/Display/Status";
constexpr const char* show = "Remote/ShowInVerifier";
constexpr const char* parent = "General/ParentID";
constexpr const char* status1 = "Remote/Measurement/Status";
constexpr const char* status2 = "Remote/Measurement2/Status";
constexpr const char* approval1 = "Remote/Measurement/Approval";
constexpr const char* approval2 = "Remote/Measurement2/Approval";

TEST_F(TintgateStore, JobsAreListedByTheirVerification) {
    const std::pair<Keys, const char*> cases[] = {
        {{{display, 208}}, "waiting 208 - - -"},
        {{{display, 208}, {"Input/FileType", 4096}}, "- 208 - - -"},
        {{{display, 30}, {show, 1}, {status1, 1}, {parent, 9}}, "waiting 30 measured - 9"},
        {{{display, 211}, {show, 0}, {approval1, 1}, {approval2, 0}}, "passed 211 passed failed -"},
        {{{display, 212}, {approval1, -1}}, "failed 212 - - -"},
    };
    int id = 0;
    std::string expected = "JOB TITLE STATE CODE STRIP 1 STRIP 2 PARENT\n";
    for (const auto& [keys, line] : cases) {
        makeTicket(3, ++id, jobOf(keys));
        expected += std::to_string(id) + " " + line + "\n";
    }
    std::string table;
    for (const char sign : answer({"jobs"})) { // Without the blanks that align it.
        if (sign != ' ' || !table.ends_with(' ')) {
            table += sign;
        }
    }
    EXPECT_EQ(table, expected);
    EXPECT_EQ(json::parse(answer({"jobs", "--json"}))[3]["strip2"],
              json({{"measurements", 0}, {"passed", false}}));
}

TEST_F(TintgateStore, ResetLetsAJobRunAgain) {
    const Keys closed = {{display, 211}, {show, 0},      {parent, 5},   {status1, 1},
                         {status2, 1},   {approval1, 1}, {approval2, 0}};
    const Keys stranger = {{display, 211}, {show, 0}, {parent, 4}, {status1, 1}};
    makeTicket(3, 5, jobOf({{display, 212}, {show, 0}, {status1, 2}})); // The parent.
    makeTicket(3, 6, jobOf({{display, 208}, {show, 0}, {parent, 5}, {status1, 1}}));
    makeTicket(3, 7, jobOf(closed));
    makeTicket(3, 8, jobOf(stranger));
    const auto keysOf = [&](int id) {
        Keys read;
        const auto content = open()->content(3, id, store::KeyFilter());
        for (const auto& [key, elements] : content->keys()) {
            read[key] = std::get<int>(*elements->first());
        }
        return read;
    };

    answer({"reset", "7", "--strip", "2"});
    EXPECT_EQ(keysOf(7),
              (Keys{{display, 211}, {show, 1}, {parent, 5}, {status1, 1}, {approval1, 1}}));
    EXPECT_EQ(keysOf(5), (Keys{{display, 212}, {show, 0}, {status1, 2}}));

    EXPECT_EQ(json::parse(answer({"--json", "reset", "job/7", "--family"}))[0],
              json::parse(R"({"job": 7, "there": true, "reopened": false, "removed":
                  ["Remote/Measurement/Status", "Remote/Measurement/Approval"]})"));
    EXPECT_EQ(keysOf(7), (Keys{{display, 211}, {show, 1}, {parent, 5}}));
    EXPECT_EQ(keysOf(6), (Keys{{display, 208}, {show, 0}, {parent, 5}})); // It waits already.
    EXPECT_EQ(keysOf(5), (Keys{{display, 212}, {show, 1}}));
    EXPECT_EQ(keysOf(8), stranger);
    expectRefusal({"reset", "9"}, 1, "there is no job 9");
}

TEST_F(TintgateStore, SaysWhyItCannotGoOn) {
    expectRefusal({"make"}, 2);
    expectRefusal({"-s", m_folder.path("none"), "jobs"}, 4, "none");
    support::RunOptions full;
    full.outputPath = "/dev/full";
    EXPECT_EQ(run({"export"}, full).exitCode, 12);

    const auto warned = run({"-s", m_folder.makeFolder(std::string(128, 'd')) + "/store", "make"});
    EXPECT_EQ(warned.exitCode, 0);
    EXPECT_THAT(warned.error, HasSubstr("a job can name at most 127"));
}

/// The fixture's store is a folder, and there is a database for a copy of it.
class StoreCopy : public TintgateStore {
  protected:
    StoreCopy() {
        makeTicket(3, 7, awkwardContent());
        const auto engine = open();
        engine->create(49, 0xFFFFFF);
        engine->create(3, 90);
        engine->remove(3, 90);
        engine->putUser({"J\xF6rg", store::passwordHash("x"), true});
        for (int i = 0; i < 200; ++i) {
            // Not by way of the store, where each would wait for the disk.
            const std::string name = "store/files/" + std::to_string(i % 10) + "-\xFF";
            m_folder.makeFolder(name);
            m_folder.write(name + "/" + std::to_string(i), std::string(i * 37U, 'x'));
        }
        for (const std::string content : {"one", "", "three", "four"}) {
            std::istringstream from(content);
            engine->putFile("jobs/7.jdf", from);
        }
        engine->pruneVersions("jobs/7.jdf", 2); // So that they do not start at 1.
    }

    std::string answerOf(const std::string& address, std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), {"--store", address});
        return answer(arguments);
    }

    /// All that a store holds.
    std::string allOf(const std::string& address) const {
        const auto engine = store::openStore(address);
        std::ostringstream text;
        text << answerOf(address, {"export"});
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
    EXPECT_THAT(answer({"copy", m_address, "room"}), HasSubstr("3 tickets, 201 files and 1 user"));
    EXPECT_TRUE(allOf("room") == before);
    answer({"copy", "room", back});
    EXPECT_TRUE(allOf(back) == before);
    for (const std::string& address : {m_address, std::string("room"), back}) {
        EXPECT_EQ(answerOf(address, {"ticket", "create", "job"}), "job/91\n");
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
            // Something that has gone by the time of the next.
            try {
                store::openCopy(to)->create(3, 5);
            } catch (const store::StoreFailure& failure) {
                ASSERT_EQ(failure.fault, store::Fault::Busy) << failure.what();
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
