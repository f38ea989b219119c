// SPDX-License-Identifier: Apache-2.0
// Implements version 1.2 of freedesktop.org's desktop notifications.
#include "companions/measure-tool/Notification.h"

#include <chrono>
#include <cstdlib>
#include <memory>
#include <optional>
#include <string_view>

#include <systemd/sd-bus.h>

#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Failure.h"
#include "companions/measure-tool/Text.h"

namespace measuretool {
namespace {

constexpr std::chrono::seconds patience{2};

constexpr const char* service = "org.freedesktop.Notifications";
constexpr const char* object = "/org/freedesktop/Notifications";

/// Stays on the screen until dismissed: the job waits for this person.
constexpr int critical = 2;

using Bus = std::unique_ptr<sd_bus, decltype(&sd_bus_flush_close_unref)>;
using Message = std::unique_ptr<sd_bus_message, decltype(&sd_bus_message_unref)>;

Bus openBus() {
    sd_bus* bus = nullptr;
    if (sd_bus_open_user(&bus) < 0) {
        bus = nullptr;
    } else {
        sd_bus_set_method_call_timeout(
            bus, static_cast<std::uint64_t>(std::chrono::microseconds(patience).count()));
    }
    return {bus, &sd_bus_flush_close_unref};
}

/// The reply, or null.
template<class... Arguments>
Message call(const Bus& bus, const char* method, const char* types, Arguments... arguments) {
    sd_bus_message* reply = nullptr;
    if (bus) {
        sd_bus_call_method(bus.get(), service, object, service, method, nullptr, &reply, types,
                           arguments...);
    }
    return {reply, &sd_bus_message_unref};
}

/// True if the desktop interprets markup in the text.
bool readsMarkUp(const Bus& bus) {
    const Message reply = call(bus, "GetCapabilities", "");
    char** names = nullptr;
    if (!reply || sd_bus_message_read_strv(reply.get(), &names) < 0) {
        return false;
    }
    bool found = false;
    for (char** name = names; name != nullptr && *name != nullptr; ++name) {
        found = found || std::string_view(*name) == "body-markup";
        std::free(*name);
    }
    std::free(names);
    return found;
}

std::string escaped(const std::string& text) {
    std::string result;
    for (const char c : text) {
        result += c == '&' ? "&amp;" : c == '<' ? "&lt;" : c == '>' ? "&gt;" : std::string(1, c);
    }
    return result;
}

/// The notification's id, or 0 if the desktop did not show it.
std::uint32_t show(std::uint32_t replaced, const std::string& title, const std::string& text) {
    const Bus bus = openBus();
    const std::string body = readsMarkUp(bus) ? escaped(text) : text;
    // No actions, and no expiry.
    const Message reply = call(bus, "Notify", "susssasa{sv}i", "NerovaMeasure", replaced, "",
                               title.c_str(), body.c_str(), 0, 1, "urgency", "y", critical, 0);
    std::uint32_t number = 0;
    if (reply) {
        sd_bus_message_read(reply.get(), "u", &number);
    }
    return number;
}

} // namespace

Notification::~Notification() {
    if (m_number == 0 || m_failed) {
        return;
    }
    try {
        resultBefore(Clock::now() + patience, [number = m_number] {
            return call(openBus(), "CloseNotification", "u", number) != nullptr;
        });
    } catch (const std::exception&) {
        // Cancelled again, or no thread available: the notification stays on the screen.
    }
}

void Notification::show(const std::string& title, std::initializer_list<std::string> lines) {
    const char* const address = std::getenv("DBUS_SESSION_BUS_ADDRESS");
    if (m_failed || address == nullptr || *address == '\0') {
        return;
    }
    std::string text;
    for (const std::string& line : lines) {
        text += (text.empty() ? "" : "\n") + printable(line);
    }
    // The bus itself may be slow to answer; the limit of a call does not cover that.
    const auto number = resultBefore(Clock::now() + patience,
                                     [replaced = m_number, title = printable(title), text] {
                                         return measuretool::show(replaced, title, text);
                                     });
    m_number = number.value_or(0);
    m_failed = m_number == 0;
}

} // namespace measuretool
