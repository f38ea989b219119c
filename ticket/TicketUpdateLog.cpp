// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketUpdateLog.h"

clTICKET_UPDATE_LOG::clTICKET_UPDATE_LOG(const char*) {}

void clTICKET_UPDATE_LOG::printf(const char*, ...) {}

void clTICKET_UPDATE_LOG::close() {}
