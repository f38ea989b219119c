// SPDX-License-Identifier: Apache-2.0
// Measurements that arrive in a folder and the folders below it, each as soon as it is complete.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "companions/tintgate-check/StopSignal.h"

namespace check {

class Arrivals {
  public:
    virtual ~Arrivals() = default;

    /// Waits for measurements, at most for one round. Returns the paths of those that are complete
    /// by now; a path may come again after its file has changed. Throws Failure (NotDone) if the
    /// folder is gone.
    virtual std::vector<std::string> wait(const StopSignal& stop) = 0;
};

/// The kernel reports files that were closed after writing or renamed into place. Those that are
/// there already, also in folders that are moved here, are complete when their size and time have
/// not changed for two rounds of `interval` seconds. Throws Failure (NotDone) if the folder can't
/// be watched.
std::unique_ptr<Arrivals> notifiedArrivals(const std::string& folder, double interval);

/// For file systems that report no changes: all files are looked at in every round. A folder that
/// is gone for a while, as an unmounted share is, is no failure.
std::unique_ptr<Arrivals> polledArrivals(const std::string& folder, double interval);

} // namespace check
