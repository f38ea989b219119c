// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/JobJdf.h"

#include <algorithm>
#include <iterator>
#include <ostream>
#include <sstream>
#include <streambuf>

#include <strings.h>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/JdfText.h"
#include "companions/tintgate-store/KeyValue.h"
#include "companions/tintgate-store/TicketName.h"
#include "jobkeys/JobState.h"
#include "jobkeys/Lookups.h"

namespace admin {

namespace {

/// Collects what is written to it, up to the size limit of a JDF. Throws Failure (JdfTooLarge)
/// above that.
class JdfContent : private std::streambuf {
  public:
    JdfContent() : m_stream(this) { m_stream.exceptions(std::ios::badbit); }
    std::ostream& stream() { return m_stream; }
    std::string text() { return std::move(m_text); }

  private:
    int_type overflow(int_type byte) override {
        const char one = traits_type::to_char_type(byte);
        xsputn(&one, 1);
        return byte;
    }
    std::streamsize xsputn(const char* bytes, std::streamsize count) override {
        if (m_text.size() + static_cast<std::size_t>(count) > largestJdf) {
            throw Failure(Status::JdfTooLarge, "a JDF has at most 256 MiB");
        }
        m_text.append(bytes, static_cast<std::size_t>(count));
        return count;
    }

    std::string m_text;
    std::ostream m_stream;
};

std::string contentOf(store::StoreEngine& store, const std::string& path) {
    JdfContent content;
    store.getFile(path, content.stream());
    return content.text();
}

std::string versionOf(store::StoreEngine& store, const std::string& path, int number) {
    JdfContent content;
    store.getVersion(path, number, content.stream());
    return content.text();
}

bool isThere(store::StoreEngine& store, const std::string& path) {
    try {
        contentOf(store, path);
    } catch (const store::StoreFailure& failure) {
        if (failure.status != store::Fault::NoFile) {
            throw;
        }
        return false;
    } catch (const Failure&) { // Too large; reported when it is processed.
    }
    return true;
}

/// Replaces content `before` by `after`. If another process changed the file (the version just kept
/// is neither of these), restores that version and throws Failure (Busy).
void exchange(store::StoreEngine& store, const std::string& path, const std::string& before,
              const std::string& after) {
    std::istringstream from(after);
    store.putFile(path, from);
    const auto versions = store.versions(path);
    if (versions.empty()) { // Pruned already.
        return;
    }
    const int last = versions.back().number;
    const std::string kept = versionOf(store, path, last);
    if (kept != before && kept != after) {
        store.restoreVersion(path, last);
        throw Failure(Status::Busy, "another process wrote the file meanwhile: try again");
    }
}

/// Prefixes failures with the name of the file.
template<class Work>
auto about(const std::string& path, Work work) {
    try {
        return work();
    } catch (const Failure& failure) {
        throw Failure(failure.status, printable(path) + ": " + failure.what());
    }
}

using Versions = std::vector<std::pair<int, std::string>>;

/// By number, with the current file last, as number 0.
Versions allVersions(store::StoreEngine& store, const std::string& path, int from) {
    Versions versions;
    for (const auto& version : store.versions(path)) {
        if (version.number >= from) {
            versions.emplace_back(version.number, versionOf(store, path, version.number));
        }
    }
    versions.emplace_back(0, contentOf(store, path));
    return versions;
}

std::string shownVersion(int number) {
    return number == 0 ? "the current file" : "version " + std::to_string(number);
}

/// Whether a version belongs to the delivery with this unchanged part, before or after updates.
bool isOfDelivery(const std::string& text, const std::string& unchanged, int updates) {
    try {
        return unchangedPart(prepared(text, updates).text) == unchanged;
    } catch (const Failure& failure) {
        if (failure.status != Status::JdfNotSound) {
            throw;
        }
        return false;
    }
}

/// Throws Failure (JdfAmbiguous) if intact versions after the base belong to another delivery: it
/// is unknown whether they or the damaged ones were delivered last.
void checkDelivery(const Versions& versions, Versions::const_iterator base,
                   const std::string& sound, int updates) {
    const std::string unchanged = unchangedPart(sound);
    for (auto next = std::next(base); next != versions.end(); ++next) {
        if (isSound(next->second) && !isOfDelivery(next->second, unchanged, updates)) {
            throw Failure(Status::JdfAmbiguous,
                          shownVersion(base->first) + " and " + shownVersion(next->first) +
                              " differ in more than measurements, dates and blanks: say with "
                              "--from the number of the first version that counts (see file "
                              "versions)");
        }
    }
}

} // namespace

std::vector<std::string> jdfPathsOf(store::StoreEngine& store, int job) {
    const std::string name = textOf({jobType, job});
    if (!store.exists(jobType, job)) {
        throw Failure(Status::NotThere, "there is no " + name);
    }
    const auto text = [&](const std::string& key) {
        return textOf(store.key(jobType, job, key)).value_or("");
    };
    std::vector<std::string> paths;
    const std::string folder = jobkeys::jdfFolder(text);
    const std::string jdf = text(jobkeys::jdfNameKey);
    if (!folder.empty() && !jdf.empty()) {
        paths.push_back(folder + "/" + jdf);
    }
    const int subType = integerOf(store.key(jobType, job, jobkeys::subTypeKey)).value_or(0);
    const std::string remote = text(jobkeys::remoteJdfKey);
    if (jobkeys::isVerification(subType) && !remote.empty()) {
        paths.push_back(remote);
    }
    if (paths.empty()) {
        throw Failure(Status::NotThere, name + " names no JDF (Output/Jdf/FileName, "
                                               "System/Folders/Temp)");
    }
    std::string missing;
    const auto gone = [&](const std::string& path) {
        const bool there = isThere(store, path);
        missing += there ? "" : " " + printable(path);
        return !there;
    };
    paths.erase(std::remove_if(paths.begin(), paths.end(), gone), paths.end());
    if (paths.empty()) {
        throw Failure(Status::NotThere, "the JDF of " + name + " does not exist:" + missing);
    }
    return paths;
}

bool isJdfName(const std::string& path) {
    constexpr std::size_t length = 4;
    return path.size() > length && strcasecmp(path.c_str() + path.size() - length, ".jdf") == 0;
}

int updatesAtDelivery(store::StoreEngine& store) {
    return std::max(0, integerOf(store.key(0, 0, "System/Jdf/Updates")).value_or(0));
}

std::vector<std::string> readyJdf(store::StoreEngine& store, const std::string& path, int updates) {
    return about(path, [&] {
        const std::string before = contentOf(store, path);
        const PreparedJdf jdf = prepared(before, updates);
        if (!jdf.changes.empty()) {
            exchange(store, path, before, jdf.text);
        }
        return jdf.changes;
    });
}

Rebuilt rebuildJdf(store::StoreEngine& store, const std::string& path, int from, int updates) {
    return about(path, [&] {
        const auto versions = allVersions(store, path, from);
        const auto base = std::find_if(versions.begin(), versions.end(),
                                       [](const auto& version) { return isSound(version.second); });
        if (base == versions.end()) {
            throw Failure(Status::JdfNotSound, "no version of it is well-formed");
        }
        const std::string sound = prepared(base->second, updates).text;
        if (from == 0) {
            checkDelivery(versions, base, sound, updates);
        }
        std::vector<std::string> added;
        for (const auto& [number, text] : versions) {
            for (auto& measurement : measurementsIn(text)) {
                if (sound.find(measurement) == std::string::npos &&
                    std::find(added.begin(), added.end(), measurement) == added.end()) {
                    added.push_back(std::move(measurement));
                }
            }
        }
        const std::string after = withMeasurements(sound, added);
        const std::string& before = versions.back().second;
        Rebuilt result{base->first, static_cast<int>(measurementsIn(after).size()),
                       after != before};
        if (result.changed) {
            exchange(store, path, before, after);
        }
        return result;
    });
}

} // namespace admin
