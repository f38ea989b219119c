// SPDX-License-Identifier: Apache-2.0
// The signals that end a watch: SIGTERM and SIGINT.
#pragma once

#include "base/Descriptor.h"

namespace check {

/// From its construction on these signals end nothing by themselves, in threads started later
/// neither. They are pending until wait() or isPending() reports them, and remain so.
class StopSignal {
  public:
    StopSignal();

    /// Readable as soon as such a signal has come.
    int descriptor() const { return m_file.get(); }

    bool isPending() const;

  private:
    base::Descriptor m_file;
};

} // namespace check
