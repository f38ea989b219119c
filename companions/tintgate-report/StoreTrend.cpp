// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <map>
#include <span>
#include <tuple>

#include "analysis/Criteria.h"
#include "analysis/Judgement.h"
#include "colour/Difference.h"
#include "companions/tintgate-report/Failure.h"
#include "companions/tintgate-report/Files.h"
#include "companions/tintgate-report/LocalPages.h"
#include "companions/tintgate-report/ServerLookups.h"
#include "companions/tintgate-report/Targets.h"
#include "companions/tintgate-report/TicketKeys.h"
#include "companions/tintgate-report/Trend.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/PatchArrays.h"
#include "jobkeys/ResultPositions.h"
#include "jobkeys/Tickets.h"
#include "store/StoreEngine.h"

namespace report {

using namespace jobkeys;

namespace {

/// What a sample is made of, beside the strip's measurement.
constexpr const char* sharedKeys[] = {"Input/Title",
                                      "CMM/PaperName",
                                      "Workflow/Name",
                                      "System/InstallFolder",
                                      "Footer/Dynstrip/UseDynstrip",
                                      "Footer/Dynstrip/DeviceID"};
constexpr const char* stripOnlyKeys[] = {"Workflow/Verify/ComparisonMethod",
                                         "Workflow/Verify/DeltaEMode", stripFileKey,
                                         nestedStripFileKey};
constexpr const char* measuredKeys[] = {
    "Approval", "Date", "Time", "Values/Measured", "Values/Approval", "Values/PSDApproval"};

store::KeyFilter keysOf(Strip strip) {
    std::vector<std::string> names = Targets::keys(strip);
    names.insert(names.end(), std::begin(sharedKeys), std::end(sharedKeys));
    for (const char* key : stripOnlyKeys) {
        names.push_back(stripKey(strip, key));
    }
    for (const std::span<const char* const> group :
         std::initializer_list<std::span<const char* const>>{measuredKeys, labArrays, cmykArrays}) {
        for (const char* name : group) {
            names.push_back(measurementKey(strip, name));
        }
    }
    std::vector<const char*> table;
    for (const std::string& name : names) {
        table.push_back(name.c_str());
    }
    table.push_back(nullptr);
    return store::KeyFilter(table.data());
}

using SharedContent = std::shared_ptr<const store::TicketContent>;

// ---- Jobs that have a result

struct Verified {
    int job = 0;
    int parent = 0; ///< Of a job on a sheet with others; 0 for none.
    Strip strip = Strip::First;
    std::int64_t time = 0;
};

/// The strips of all jobs that have a result of a time that the filter takes; those on a sheet with
/// others first.
std::vector<Verified> verifiedStrips(store::StoreEngine& store, const Filter& filter) {
    std::vector<std::string> names;
    for (const Strip strip : strips) {
        for (const char* name : {"Approval", "Date", "Time"}) {
            names.push_back(measurementKey(strip, name));
        }
    }
    names.emplace_back("General/ParentID");
    struct Row {
        bool judged = false;
        std::string date;
        std::string time;
    };
    std::map<std::pair<int, Strip>, Row> rows;
    std::map<int, int> parents;
    constexpr std::size_t anySize = static_cast<std::size_t>(-1) / 2;
    store.keysOfAll(jobType, names, anySize, [&](int id, std::size_t name, const auto& elements) {
        if (name == names.size() - 1) {
            parents[id] = integerOf(elements).value_or(0);
            return;
        }
        Row& row = rows[{id, strips[name / 3]}];
        if (name % 3 == 0) {
            row.judged = integerOf(elements).value_or(-1) >= 0;
        } else {
            (name % 3 == 1 ? row.date : row.time) = textOf(elements);
        }
    });
    std::vector<Verified> verified;
    for (const auto& [key, row] : rows) {
        auto time = timeOf(row.date + " " + row.time);
        if (!time) {
            time = timeOf(row.date);
        }
        if (row.judged && time && filter.takesTime(*time)) {
            verified.push_back({key.first, parents[key.first], key.second, *time});
        }
    }
    std::stable_sort(verified.begin(), verified.end(),
                     [](const auto& a, const auto& b) { return (a.parent > 0) > (b.parent > 0); });
    return verified;
}

// ---- One sample

/// A criterion with what the preset asks of it.
report::Criterion criterionOf(const analysis::Criterion& known, const Preset& preset) {
    report::Criterion criterion;
    criterion.name = known.name;
    criterion.title = known.title;
    criterion.unit = analysis::unit(known.quantity);
    if (!preset.values) {
        return criterion;
    }
    const auto& values = *preset.values;
    const double tolerance =
        preset.psd() ? values.psdPresetValues[known.psdEntry] : values.presetValues[known.index];
    criterion.used = (preset.psd() ? values.usedForPSDResult[known.psdEntry]
                                   : values.usedForResult[known.index]) != 0;
    criterion.decimals = std::clamp(values.decimalPlaces[known.index], 0, 6);
    if (criterion.used || tolerance != 0) {
        criterion.tolerance = tolerance;
    }
    return criterion;
}

struct Results {
    std::vector<double> measured;
    std::vector<int> approvals; ///< By the server's position, or by entry for the PSD kind.
};

std::optional<bool> approvalOf(const Results& results, int verdict, bool isPsd) {
    const auto position = positionOfVerdict(verdict, isPsd);
    if (!position || static_cast<std::size_t>(*position) >= results.approvals.size()) {
        return std::nullopt;
    }
    return results.approvals[static_cast<std::size_t>(*position)] != 0;
}

/// The measured value that belongs to a criterion. Nothing if the server does not show it.
std::optional<double> measuredOf(const Results& results, const analysis::Criterion& known,
                                 bool showsSpotMaximum) {
    const auto position = positionOfVerdict(known.index, false);
    if (!position || valueAt(*position, showsSpotMaximum) != known.value ||
        static_cast<std::size_t>(*position) >= results.measured.size()) {
        return std::nullopt;
    }
    return results.measured[static_cast<std::size_t>(*position)];
}

/// Whether the server's table pairs values and verdicts as the criteria do.
constexpr bool agreesWithPositions(const analysis::Criterion& known) {
    const auto position = positionOfVerdict(known.index, false);
    return !position || valueAt(*position, true) == known.value;
}
static_assert(std::all_of(std::begin(analysis::criteria), std::end(analysis::criteria),
                          agreesWithPositions));

/// Fills in value and outcome as they were judged then. True where today's tolerance would say
/// something else.
bool judge(report::Criterion& criterion, double value, std::optional<bool> approval) {
    if (!(value >= 0)) { // -1 stands for no answer.
        criterion.outcome =
            criterion.tolerance ? report::Outcome::Unanswered : report::Outcome::Unjudged;
        return false;
    }
    criterion.value = value;
    criterion.patches = 1;
    if (!criterion.tolerance) {
        return false;
    }
    criterion.rounded = analysis::roundedTo(value, criterion.decimals);
    const bool within = *criterion.rounded <= *criterion.tolerance;
    criterion.outcome = approval.value_or(within) ? report::Outcome::Pass : report::Outcome::Fail;
    return approval && *approval != within;
}

bool addCriteria(report::Sample& sample, const Results& results, const Preset& preset) {
    bool changed = false;
    const bool showsSpotMaximum =
        !preset.psd() || preset.values->usedForPSDResult[psdSpotMaximum] == 1;
    for (const analysis::Criterion& known : analysis::criteria) {
        const auto measured = measuredOf(results, known, showsSpotMaximum);
        if (!measured) {
            continue;
        }
        report::Criterion criterion = criterionOf(known, preset);
        changed |= judge(criterion, *measured, approvalOf(results, known.index, preset.psd()));
        if (criterion.value || criterion.used) {
            sample.criteria.push_back(std::move(criterion));
        }
    }
    return changed;
}

report::InkColours inksOf(const store::TicketContent& job, Strip strip) {
    std::vector<double> lab[3];
    std::vector<double> cmyk[4];
    std::size_t patches = mostElements;
    const auto read = [&](std::vector<double>& values, const char* name) {
        values = doublesOf(job.find(measurementKey(strip, name)));
        patches = std::min(patches, values.size());
    };
    for (int i = 0; i < 3; ++i) {
        read(lab[i], labArrays[i]);
    }
    for (int i = 0; i < 4; ++i) {
        read(cmyk[i], cmykArrays[i]);
    }
    report::InkMeans means;
    for (std::size_t i = 0; i < patches; ++i) {
        const double device[4] = {cmyk[0][i], cmyk[1][i], cmyk[2][i], cmyk[3][i]};
        if (const auto ink = report::inkOf(device, 4)) {
            means.add(*ink, {lab[0][i], lab[1][i], lab[2][i]});
        }
    }
    return means.means();
}

report::Verdict verdictOf(const report::Sample& sample, int approval) {
    if (approval > 0) {
        return report::Verdict::Passed;
    }
    const auto used = [&](report::Outcome outcome) {
        return std::any_of(sample.criteria.begin(), sample.criteria.end(),
                           [&](const auto& c) { return c.used && c.outcome == outcome; });
    };
    return used(report::Outcome::Unanswered) ? report::Verdict::Incomplete
                                             : report::Verdict::Failed;
}

report::Sample sampleOf(const store::TicketContent& job, const Verified& verified,
                        ServerLookups& server, const Preset& preset) {
    report::Sample sample;
    sample.time = verified.time;
    sample.jobId = verified.job;
    sample.strip = numberOf(verified.strip);
    sample.title = textOf(job.find("Input/Title"));
    sample.paper = textOf(job.find("CMM/PaperName"));
    sample.workflow = textOf(job.find("Workflow/Name"));
    sample.instrument = server.instrument(job, verified.strip);
    sample.preset = preset.name;
    sample.formula = colour::formulaName(colour::formulaFromNumber(
        integerOf(job.find(stripKey(verified.strip, "Workflow/Verify/DeltaEMode"))).value_or(0)));
    return sample;
}

/// Results by family, strip and measured values, and the sample that each has become.
using KnownResults = std::map<std::tuple<int, Strip, std::string>, std::size_t>;

/// The samples of a store, one by one.
class Gatherer {
  public:
    /// Samples go to those that other stores gave, and results that these know are left out.
    Gatherer(store::StoreEngine& store, const Filter& filter, const PagePlace& place,
             KnownResults& known, Gathered& gathered)
        : m_store(store), m_filter(filter), m_place(place), m_server(store), m_targets(store),
          m_known(known), m_gathered(gathered) {}

    void add(const Verified& verified) {
        const SharedContent job =
            m_store.content(jobType, verified.job, m_keys[verified.strip == Strip::First ? 0 : 1]);
        if (!job) { // Deleted meanwhile.
            return;
        }
        const Strip strip = verified.strip;
        const int id =
            integerOf(job->find(stripKey(strip, "Workflow/Verify/ComparisonMethod"))).value_or(0);
        const Preset& preset = m_server.preset(id, textOf(job->find("System/InstallFolder")));
        report::Sample sample = sampleOf(*job, verified, m_server, preset);
        sample.presetId = id;
        if (!m_place.folder.empty()) {
            if (const std::string page = m_pages.of(sample); !page.empty()) {
                sample.page = relativeTo(m_place.folder, page);
            }
        }
        Results results;
        results.measured = doublesOf(job->find(measurementKey(strip, "Values/Measured")));
        if (!m_filter.takes(sample) || isKnown(verified, results.measured, sample.page)) {
            return;
        }
        results.approvals = integersOf(job->find(
            measurementKey(strip, preset.psd() ? "Values/PSDApproval" : "Values/Approval")));
        m_changes += addCriteria(sample, results, preset);
        sample.verdict =
            verdictOf(sample, integerOf(job->find(measurementKey(strip, "Approval"))).value_or(0));
        sample.inks = inksOf(*job, strip);
        Target target = m_targets.of(*job, verified.strip, verified.time);
        sample.target = std::move(target.name);
        sample.targetKey = std::move(target.key);
        sample.aims = target.aims;
        m_gathered.samples.push_back(std::move(sample));
    }

    void addNotes(const languages::Texts& say) {
        for (const int id : m_server.presetsWithoutFile()) {
            std::string note = say("trendNote.presetUnreadable", {{"preset", std::to_string(id)}});
            auto& notes = m_gathered.notes;
            if (std::find(notes.begin(), notes.end(), note) == notes.end()) {
                notes.push_back(std::move(note));
            }
        }
        if (m_changes != 0) {
            m_gathered.notes.push_back(say("trendNote.otherTolerances", {{"count", m_changes}}));
        }
    }

  private:
    /// A run writes the result of a sheet to each of its jobs and to their parent. It counts once,
    /// for the first job, and leads to the page wherever in the family it is. So does a job that is
    /// in two stores because its move to an archive was cut off.
    bool isKnown(const Verified& verified, const std::vector<double>& measured,
                 const std::string& page) {
        const int family = verified.parent > 0 ? verified.parent : verified.job;
        if (measured.empty()) {
            return false;
        }
        // As bytes, since a ticket may hold what is no number and has no order.
        std::string bytes(reinterpret_cast<const char*>(measured.data()),
                          measured.size() * sizeof(double));
        const auto [at, fresh] = m_known.try_emplace({family, verified.strip, std::move(bytes)},
                                                     m_gathered.samples.size());
        if (!fresh && m_gathered.samples[at->second].page.empty()) {
            m_gathered.samples[at->second].page = page;
        }
        return !fresh;
    }

    store::StoreEngine& m_store;
    const Filter& m_filter;
    const PagePlace& m_place;
    ServerLookups m_server;
    Targets m_targets;
    const LocalPages m_pages;
    const store::KeyFilter m_keys[2] = {keysOf(Strip::First), keysOf(Strip::Second)};
    KnownResults& m_known;
    Gathered& m_gathered;
    std::size_t m_changes = 0;
};

} // namespace

Gathered gatherStores(const std::vector<std::string>& addresses, const Filter& filter,
                      const PagePlace& place, const languages::Texts& say) {
    Gathered gathered;
    KnownResults known;
    for (const auto& address : addresses) {
        try {
            const auto store = store::openStore(address, store::Access::Read);
            Gatherer gatherer(*store, filter, place, known, gathered);
            for (const Verified& verified : verifiedStrips(*store, filter)) {
                gatherer.add(verified);
            }
            gatherer.addNotes(say);
        } catch (const store::StoreFailure& failure) {
            throw Failure(Status::Store,
                          (addresses.size() > 1 ? address + ": " : "") + failure.what());
        }
    }
    return gathered;
}

} // namespace report
