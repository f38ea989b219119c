// The sink of this test program: it listens.
#include "ticket/TicketUpdateLog.h"

#include <cstdarg>
#include <cstdio>
#include <string>
#include <utility>

#include "Server.h"

namespace {

std::string written;

} // namespace

clTICKET_UPDATE_LOG::clTICKET_UPDATE_LOG(const char*) {}

void clTICKET_UPDATE_LOG::printf(const char* format, ...) {
    char text[1024];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    written += text;
}

void clTICKET_UPDATE_LOG::close() {}

std::string takeUpdateLog() {
    return std::exchange(written, "");
}
