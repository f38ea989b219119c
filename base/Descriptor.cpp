// SPDX-License-Identifier: Apache-2.0
#include "base/Descriptor.h"

#include <cerrno>
#include <utility>

#include <unistd.h>

namespace base {

Descriptor& Descriptor::operator=(Descriptor&& other) noexcept {
    if (this != &other) {
        close();
        m_number = other.release();
    }
    return *this;
}

int Descriptor::release() {
    return std::exchange(m_number, -1);
}

bool Descriptor::close() {
    const int number = release();
    return number < 0 || ::close(number) == 0;
}

std::size_t writeAll(const Descriptor& file, std::string_view bytes) {
    std::size_t done = 0;
    while (done < bytes.size()) {
        const ssize_t count = ::write(file.get(), bytes.data() + done, bytes.size() - done);
        if (count < 0 && errno != EINTR) {
            break;
        }
        done += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    return done;
}

std::ptrdiff_t readAll(const Descriptor& file, char* to, std::size_t size) {
    std::size_t done = 0;
    while (done < size) {
        const ssize_t count = ::read(file.get(), to + done, size - done);
        if (count < 0 && errno != EINTR) {
            return -1;
        }
        if (count == 0) {
            break;
        }
        done += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    return static_cast<std::ptrdiff_t>(done);
}

} // namespace base
