// SPDX-License-Identifier: Apache-2.0
// An open file, folder or pipe.
#pragma once

#include <cstddef>
#include <string_view>

namespace base {

/// Owns a file descriptor; negative means none.
class Descriptor {
  public:
    Descriptor() = default;
    explicit Descriptor(int number) : m_number(number) {}
    Descriptor(Descriptor&& other) noexcept : m_number(other.release()) {}
    Descriptor& operator=(Descriptor&& other) noexcept;
    ~Descriptor() { close(); }

    int get() const { return m_number; }
    bool isOpen() const { return m_number >= 0; }
    /// Gives the descriptor up without closing it.
    int release();
    /// Returns false, with errno set, if closing failed; some file systems report a full disk only
    /// here. Without a descriptor it succeeds.
    bool close();

  private:
    int m_number = -1;
};

/// Writes everything, however many calls it takes, and continues after signals. Returns the bytes
/// written: all of them, or fewer with errno set.
std::size_t writeAll(const Descriptor& file, std::string_view bytes);

/// Reads up to `size` bytes, however many calls it takes. Returns their number, which is smaller
/// only at the end; -1 with errno set for a failure.
std::ptrdiff_t readAll(const Descriptor& file, char* to, std::size_t size);

} // namespace base
