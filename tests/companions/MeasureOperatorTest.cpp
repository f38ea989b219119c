// SPDX-License-Identifier: Apache-2.0
// Output of the measuring tool for the operator: on a terminal and on a desktop.
#include <atomic>
#include <chrono>
#include <cstdint>
#include <mutex>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <signal.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <systemd/sd-bus.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "MeasureRuns.h"

namespace {

using namespace measuretool;
using testing::HasSubstr;

/// A desktop that shows notifications, on its own session bus.
class Desktop {
  public:
    Desktop() {
        const support::Outcome bus = support::run(
            {"dbus-daemon", "--session", "--fork", "--print-address=1", "--print-pid=1"});
        std::istringstream(bus.output) >> m_address >> m_busNumber;
        EXPECT_GT(m_busNumber, 0) << bus.error;
        m_thread = std::thread([this] { serve(); });
        while (!m_ready) {
            std::this_thread::sleep_for(std::chrono::milliseconds(5));
        }
    }
    ~Desktop() {
        m_stopped = true;
        m_thread.join();
        if (m_busNumber > 0) {
            kill(m_busNumber, SIGTERM);
        }
    }
    Desktop(const Desktop&) = delete;
    Desktop& operator=(const Desktop&) = delete;

    const std::string& address() const { return m_address; }

    /// Each call as one line: "notify REPLACED: TITLE | TEXT", "close NUMBER".
    std::vector<std::string> calls() const {
        const std::lock_guard lock(m_mutex);
        return m_calls;
    }

  private:
    void note(const std::string& call) {
        const std::lock_guard lock(m_mutex);
        m_calls.push_back(call);
    }

    static int capabilities(sd_bus_message* message, void*, sd_bus_error*) {
        return sd_bus_reply_method_return(message, "as", 2, "body", "body-markup");
    }
    static int notify(sd_bus_message* message, void* self, sd_bus_error*) {
        const char* texts[4] = {};
        std::uint32_t replaced = 0;
        sd_bus_message_read(message, "susss", &texts[0], &replaced, &texts[1], &texts[2],
                            &texts[3]);
        static_cast<Desktop*>(self)->note("notify " + std::to_string(replaced) + ": " + texts[2] +
                                          " | " + texts[3]);
        return sd_bus_reply_method_return(message, "u", replaced == 0 ? 7 : replaced);
    }
    static int closed(sd_bus_message* message, void* self, sd_bus_error*) {
        std::uint32_t number = 0;
        sd_bus_message_read(message, "u", &number);
        static_cast<Desktop*>(self)->note("close " + std::to_string(number));
        return sd_bus_reply_method_return(message, "");
    }

    void serve() {
        static const sd_bus_vtable table[] = {
            SD_BUS_VTABLE_START(0),
            SD_BUS_METHOD("GetCapabilities", "", "as", capabilities, SD_BUS_VTABLE_UNPRIVILEGED),
            SD_BUS_METHOD("Notify", "susssasa{sv}i", "u", notify, SD_BUS_VTABLE_UNPRIVILEGED),
            SD_BUS_METHOD("CloseNotification", "u", "", closed, SD_BUS_VTABLE_UNPRIVILEGED),
            SD_BUS_VTABLE_END};
        sd_bus* bus = nullptr;
        EXPECT_GE(sd_bus_new(&bus), 0);
        sd_bus_set_address(bus, m_address.c_str());
        sd_bus_set_bus_client(bus, 1);
        EXPECT_GE(sd_bus_start(bus), 0);
        sd_bus_add_object_vtable(bus, nullptr, "/org/freedesktop/Notifications",
                                 "org.freedesktop.Notifications", table, this);
        EXPECT_GE(sd_bus_request_name(bus, "org.freedesktop.Notifications", 0), 0);
        m_ready = true;
        while (!m_stopped) {
            if (sd_bus_process(bus, nullptr) == 0) {
                sd_bus_wait(bus, 20'000);
            }
        }
        sd_bus_flush_close_unref(bus);
    }

    std::string m_address;
    int m_busNumber = 0;
    mutable std::mutex m_mutex;
    std::vector<std::string> m_calls;
    std::atomic<bool> m_ready = false;
    std::atomic<bool> m_stopped = false;
    std::thread m_thread;
};

const std::string names = "CGATS.17\n" + format(cmyk + "\tLAB_L\tLAB_A\tLAB_B") + begin;

TEST_F(MeasureTool, TellsTheOperatorWhoseTurnItIs) {
    const Desktop desktop;
    const std::string definition = definitionOf({"100\t0\t0\t0"});
    const std::string wrong = names + "1 99 0 0 0 33 0 0\nEND_DATA\n";
    const std::string right = names + "1 100 0 0 0 22 0 0\nEND_DATA\n";
    m_folder.write("definition.it8", definition);
    support::RunOptions options =
        environmentWith("instrument = file\nfile = <new>.txt\nwait = 90\ndelay = 50\n");
    options.environment["DBUS_SESSION_BUS_ADDRESS"] = desktop.address();
    std::jthread software([&] {
        for (const std::string& text : {wrong, right}) {
            std::this_thread::sleep_for(std::chrono::milliseconds(1200));
            m_folder.write("<new>.txt", text);
        }
    });
    // On a terminal, the output of `script` is the program's output.
    const std::string command = std::string(MEASURE_TOOL) + " " + writeOptions();
    const support::Outcome outcome =
        support::run({"script", "--quiet", "--return", "--command", command, "/dev/null"}, options);
    software.join();
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_EQ(takeResult().lab.at(0).L, 22);

    const std::string path = m_folder.path("<new>.txt");
    const std::string shown = m_folder.path("&lt;new&gt;.txt");
    const std::string problem = ": there is no patch 1, which is 100 0 0 0, and row 1, which is 99 "
                                "0 0 0, was not requested";
    EXPECT_THAT(desktop.calls(),
                testing::ElementsAre(
                    testing::StartsWith("notify 0: Measure strip.it8 | Export it as " + shown +
                                        "\n1:30 left, until "),
                    testing::StartsWith("notify 7: Measure strip.it8 again | Not accepted: " +
                                        shown + problem + "\nExport it as " + shown + "\n1:2"),
                    "close 7"));
    for (const std::string& words :
         {"Your turn: measure strip.it8 and export it as " + path + "\r\n",
          std::string("1:30 left"), "Not accepted: " + path + problem + "\r\n",
          "Measure strip.it8 and export it again as " + path,
          std::string("Measuring 1 patches, the first is 100 0 0 0"),
          std::string("Patch 1 of 1    100 0 0 0    L*a*b* 22.00 0.00 0.00\r\n")}) {
        EXPECT_THAT(outcome.output, HasSubstr(words));
    }
    // The time goes on after a refusal. Which second is shown depends on the machine's load.
    const std::size_t again = outcome.output.find("export it again");
    ASSERT_NE(again, outcome.output.npos);
    EXPECT_THAT(outcome.output.substr(again), testing::ContainsRegex("1:2[0-9] left"));
}

// A desktop that does not answer, or none, causes only a short delay.
TEST_F(MeasureTool, DoesWithoutADesktop) {
    const std::string definition = definitionOf({"100\t0\t0\t0"});
    m_folder.write("definition.it8", definition);
    // A bus that accepts connections but never answers.
    const int silent = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un name{};
    name.sun_family = AF_UNIX;
    m_folder.path("silent").copy(name.sun_path, sizeof name.sun_path - 1);
    ASSERT_EQ(bind(silent, reinterpret_cast<const sockaddr*>(&name), sizeof name), 0);
    ASSERT_EQ(listen(silent, 1), 0);
    for (const std::string& address :
         {std::string("unix:path=/nowhere"), "unix:path=" + m_folder.path("silent"),
          std::string("nonsense")}) {
        support::RunOptions options =
            environmentWith("instrument = file\nfile = new.txt\nwait = 1\n");
        options.environment["DBUS_SESSION_BUS_ADDRESS"] = address;
        const auto start = std::chrono::steady_clock::now();
        expectFailure(support::run({MEASURE_TOOL, writeOptions()}, options), 7,
                      "was not exported in time");
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(6));
    }
    close(silent);
}

} // namespace
