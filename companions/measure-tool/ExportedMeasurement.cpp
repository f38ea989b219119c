// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/ExportedMeasurement.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <optional>
#include <string>
#include <utility>

#include <sys/stat.h>
#include <unistd.h>

#include "colour/ColourFile.h"
#include "companions/measure-tool/Cancel.h"
#include "companions/measure-tool/Failure.h"
#include "companions/measure-tool/Patches.h"

namespace measuretool {
namespace {

/// An exported file must not change for this long before it counts as written.
constexpr std::chrono::milliseconds rest{300};

/// A file that can't be read may still be half written. The operator hears of it after this time.
constexpr std::chrono::seconds slowWriter{3};

/// What distinguishes one state of a file from another.
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
    if (stat(path.c_str(), &status) != 0) {
        return {};
    }
    return {true,
            status.st_dev,
            status.st_ino,
            status.st_size,
            {status.st_mtim.tv_sec, status.st_mtim.tv_nsec}};
}

/// Without its folder, an export can never arrive. Reports that before anybody measures.
void checkFolder(const std::string& path) {
    const std::filesystem::path parent = std::filesystem::path(path).parent_path();
    const std::string folder = parent.empty() ? "." : parent.string();
    struct stat status {};
    const bool found = stat(folder.c_str(), &status) == 0;
    if (found && S_ISDIR(status.st_mode) && access(folder.c_str(), X_OK) == 0) {
        return;
    }
    const char* const reason =
        found && !S_ISDIR(status.st_mode) ? std::strerror(ENOTDIR) : std::strerror(errno);
    throw Failure(Status::BadExport,
                  folder + ", the folder of the export, can't be used: " + reason);
}

/// Loads a file with colours; if it has several measurement conditions, the requested one. Throws
/// Failure (BadExport) if there are no colours.
colour::DataSet load(const std::string& path, const std::string& condition) {
    colour::ColourFile file;
    colour::CgatsWants wants;
    wants.condition = condition;
    expectUsable(colour::loadColourFile(path, wants, file), Status::BadExport, path);
    if (!file.set || !file.set->hasColour()) {
        throw Failure(Status::BadExport, path + " has no measured colours");
    }
    return std::move(*file.set);
}

struct Accepted {
    colour::DataSet set;
    std::vector<std::size_t> rows;
};

/// Throws Failure (OtherPatches, OtherCondition) unless the export matches the request.
Accepted accept(colour::DataSet set, const Settings& settings, const Definition& definition) {
    const std::string& stated = set.conditions.measurement;
    if (!definition.condition.empty() && !stated.empty() && stated != definition.condition) {
        throw Failure(Status::OtherCondition, settings.file + " was measured under " + stated +
                                                  ", but the job requires " + definition.condition);
    }
    try {
        std::vector<std::size_t> rows = matchPatches(definition.chart, set, settings.bareIds);
        return {std::move(set), std::move(rows)};
    } catch (const Failure& failure) {
        throw Failure(failure.status, settings.file + ": " + failure.what());
    }
}

/// Waits for a newly written file that can be accepted.
class Wait {
  public:
    Wait(const Settings& settings, const Definition& definition, Operator& person)
        : m_settings(settings), m_definition(definition), m_person(person),
          m_end(Clock::now() + settings.wait) {}

    Accepted run() {
        const std::optional<State> known = look();
        if (!known) {
            giveUp();
        }
        m_tried = m_last = *known;
        m_person.askForExport(m_settings.file, m_end);
        while (Clock::now() < m_end) {
            pauseFor(rest);
            m_person.showTime();
            if (m_open && Clock::now() - m_failed >= slowWriter) {
                report();
            }
            if (!isNew()) {
                continue;
            }
            if (std::optional<Accepted> accepted = attempt()) {
                return std::move(*accepted);
            }
        }
        giveUp();
    }

  private:
    std::optional<State> look() const {
        return resultBefore(m_end, [path = m_settings.file] { return stateOf(path); });
    }

    /// True if there is a stable file that has not been tried yet.
    bool isNew() {
        const State now = look().value_or(State());
        const bool atRest = now == m_last;
        m_last = now;
        if (!now.exists || !atRest || now == m_tried) {
            return false;
        }
        m_tried = now;
        return true;
    }

    std::optional<Accepted> attempt() {
        try {
            auto set =
                resultBefore(m_end, [path = m_settings.file, condition = m_definition.condition] {
                    return load(path, condition);
                });
            if (!set) {
                return std::nullopt;
            }
            return accept(std::move(*set), m_settings, m_definition);
        } catch (const Failure& failure) {
            if (failure.status == Status::Cancelled || failure.status == Status::OutOfMemory) {
                throw;
            }
            m_problem.emplace(failure);
            m_failed = Clock::now();
            m_open = true;
            if (failure.status != Status::BadExport) {
                report();
            }
            return std::nullopt;
        }
    }

    void report() {
        m_open = false;
        m_person.refuse(m_problem->what());
    }

    [[noreturn]] void giveUp() const {
        if (!m_problem) {
            throw Failure(Status::BadExport, m_settings.file + " was not exported in time");
        }
        throw Failure(m_problem->status,
                      std::string(m_problem->what()) + "; no other export arrived in time");
    }

    const Settings& m_settings;
    const Definition& m_definition;
    Operator& m_person;
    const Clock::time_point m_end;
    State m_tried; ///< Too old, or already refused.
    State m_last;
    std::optional<Failure> m_problem; ///< From the latest attempt.
    Clock::time_point m_failed;
    bool m_open = false; ///< The problem has not been reported to the operator yet.
};

} // namespace

ExportedMeasurement::ExportedMeasurement(const Settings& settings, const Definition& definition,
                                         Operator& person) {
    const std::string& path = settings.file;
    unlessCancelled([path] {
        checkFolder(path);
        return true;
    });
    Accepted accepted = settings.wait.count() > 0
                            ? Wait(settings, definition, person).run()
                            : accept(unlessCancelled([path, condition = definition.condition] {
                                         return load(path, condition);
                                     }),
                                     settings, definition);
    m_set = std::move(accepted.set);
    m_rows = std::move(accepted.rows);
    if (!definition.condition.empty() && m_set.conditions.measurement.empty()) {
        person.remark(path + " does not state its measurement condition; the job requires " +
                      definition.condition);
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

} // namespace measuretool
