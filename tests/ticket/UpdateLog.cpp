// The sink of this test program: it listens.
#include "UpdateLog.h"

#include <cstdarg>
#include <cstdio>

#include "ticket/TicketUpdateLog.h"

std::string updateLog;

clTICKET_UPDATE_LOG::clTICKET_UPDATE_LOG(const char*) {}

void clTICKET_UPDATE_LOG::printf(const char* format, ...) {
    char text[1024];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    updateLog += text;
}

void clTICKET_UPDATE_LOG::close() {}

std::string takeUpdateLog() {
    std::string text;
    text.swap(updateLog);
    return text;
}
