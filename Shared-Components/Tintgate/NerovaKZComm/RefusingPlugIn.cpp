// SPDX-License-Identifier: Apache-2.0
#include "Shared-Components/Tintgate/NerovaKZComm/RefusingPlugIn.h"

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"

namespace {

template<std::int32_t Result, class... Arguments>
std::int32_t give(Arguments...) {
    return Result;
}

template<class... Arguments>
std::int32_t refuse(Arguments...) {
    return COMERR_NOT_ALIVE;
}

const MTICKET_ACCESS* noContainer(void*, std::uint64_t) {
    return nullptr;
}

} // namespace

ComGUIModuleInterface refusingPlugIn = {
    .QueryInterface = refuse,
    .AddRef = nullptr,
    .Release = nullptr,
    .CreateInstance = refuse,
    .Initialize = give<0>,
    .Login = refuse,
    .Logout = refuse,
    .Uninitialize = give<0>,
    .GetContainer = noContainer,
    .GetTicketData = refuse,
    .SetTicketData = refuse,
    .SendCommand = refuse,
    .PutFile = refuse,
    .GetFile = refuse,
    .SendJob = refuse,
    .PutFileRaw = refuse,
    .hSTicketInstance = nullptr,
    .GetFileRaw = refuse,
    .IsAlive = give<2>,
};
