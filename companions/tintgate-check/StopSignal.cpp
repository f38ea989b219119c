// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/StopSignal.h"

#include <csignal>

#include <poll.h>
#include <sys/signalfd.h>

namespace check {

StopSignal::StopSignal() {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGTERM);
    sigaddset(&signals, SIGINT);
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    m_file = base::Descriptor(signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
}

bool StopSignal::isPending() const {
    pollfd wait{m_file.get(), POLLIN, 0};
    return poll(&wait, 1, 0) > 0;
}

} // namespace check
