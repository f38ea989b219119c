#include "companions/measure-tool/ExportedMeasurement.h"

#include <sys/stat.h>

#include <string>
#include <utility>

#include "colour/ColourFile.h"
#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Failure.h"
#include "companions/measure-tool/Patches.h"

namespace measuring {
namespace {

/// So long an exported file must not change before it counts as written.
constexpr std::chrono::milliseconds rest{300};

/// What tells one state of a file from another.
struct State {
    bool exists = false;
    dev_t device = 0;
    ino_t number = 0;
    off_t size = 0;
    std::pair<time_t, long> written; ///< Seconds and nanoseconds.
    bool operator==(const State&) const = default;
};

State stateOf(const std::string& path) {
    struct stat status {};
    if (stat(path.c_str(), &status) != 0)
        return {};
    return {true,
            status.st_dev,
            status.st_ino,
            status.st_size,
            {status.st_mtim.tv_sec, status.st_mtim.tv_nsec}};
}

/// Loads a file that has colours. Throws Failure (BadExport) where it is none.
colour::DataSet load(const std::string& path) {
    colour::ColourFile file;
    expectUsable(colour::loadColourFile(path, {}, file), Status::BadExport, path);
    if (!file.set || !file.set->hasColour())
        throw Failure(Status::BadExport, path + " holds no measured colours");
    return std::move(*file.set);
}

/// Waits for a file that is newly written, and loads it. One that can't be used may be half written
/// by somebody slow: there is time for it to become better.
colour::DataSet awaitAndLoad(const std::string& path, std::chrono::seconds patience) {
    const auto end = std::chrono::steady_clock::now() + patience;
    std::string problem = path + " was not exported in time";
    State known = stateOf(path); // too old, or tried in vain
    for (State last = known; std::chrono::steady_clock::now() < end;) {
        pauseFor(rest);
        const State now = stateOf(path);
        const bool atRest = now == last;
        last = now;
        if (!now.exists || !atRest || now == known)
            continue;
        known = now;
        try {
            return load(path);
        } catch (const Failure& failure) {
            problem = failure.what();
        }
    }
    throw Failure(Status::BadExport, problem);
}

} // namespace

ExportedMeasurement::ExportedMeasurement(const Settings& settings, const colour::DataSet& chart)
    : m_set(settings.wait.count() > 0 ? awaitAndLoad(settings.file, settings.wait)
                                      : load(settings.file)) {
    try {
        m_rows = matchPatches(chart, m_set);
    } catch (const Failure& failure) {
        throw Failure(failure.status, settings.file + ": " + failure.what());
    }
}

void ExportedMeasurement::describe(colour::DataSet& measurement) const {
    measurement.originator = m_set.originator;
    measurement.descriptor = m_set.descriptor;
    measurement.created = m_set.created;
    measurement.instrumentation = m_set.instrumentation;
    measurement.conditions = m_set.conditions;
    measurement.axis = m_set.axis;
}

Reading ExportedMeasurement::measure(std::size_t patch) {
    const std::size_t row = m_rows[patch];
    const auto spectrum =
        m_set.spectra.begin() +
        static_cast<std::ptrdiff_t>(row * static_cast<std::size_t>(m_set.axis.length));
    return {m_set.lab[row], m_set.xyz[row], {spectrum, spectrum + m_set.axis.length}};
}

} // namespace measuring
