// SPDX-License-Identifier: Apache-2.0
// Writing a measurement back, against prepared tables with the same content that are sent directly
// to the plug-in's tickets: 1,617 patches with spectra, through the real bundle into a real store.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <limits>
#include <memory>
#include <random>
#include <string>
#include <variant>
#include <vector>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "SuiteRoot.h"
#include "Timing.h"
#include "base/WideBytes.h"
#include "job/KZVerifyJobProcessor.h"
#include "store/StoreEngine.h"
#include "store/Users.h"

namespace {

using bench::check;
using bench::secondsOf;

constexpr int patches = 1617;
constexpr int job = 1;
constexpr int rounds = 25;

/// Like measured values: all different, in random order.
struct Measurement {
    Measurement()
        : xyz(valuesOf(3 * patches, 100)), lab(valuesOf(3 * patches, 100)),
          cmyk(valuesOf(4 * patches, 255)), spectral(patches) {
        for (spectralRow& row : spectral) {
            const std::vector<double> values = valuesOf(spectralValueCount, 1);
            std::copy(values.begin(), values.end(), row.values);
            row.base = 380;
            row.stepsize = 10;
            row.length = spectralValueCount;
        }
        job.measurement.numPatches = patches;
        job.measurement.hasSpectral = 1;
        job.measurement.xyz = xyz.data();
        job.measurement.lab = lab.data();
        job.measurement.cmyk = cmyk.data();
        job.measurement.spectral = spectral.data();
    }

    std::vector<double> valuesOf(int count, double highest) {
        std::vector<double> values(static_cast<std::size_t>(count));
        for (double& value : values) {
            value = std::uniform_real_distribution<double>(0, highest)(m_random);
        }
        return values;
    }

    std::vector<double> xyz, lab, cmyk;
    std::vector<spectralRow> spectral;
    KZJobDataStruct job;

  private:
    std::mt19937 m_random{3}; // NOLINT: the same each time
};

/// A key with the table that replaces it, or with its single value. Must not move.
class Table {
  public:
    Table(std::string key, const store::Elements& elements) : m_key(std::move(key)) {
        elements.visit([&](int, const store::Value& value) {
            m_values.push_back(value);
            return true;
        });
        if (m_values.size() == 1) {
            return;
        }
        SETMULTIPAR record;
        record.key = m_key.c_str();
        record.position = POSITION_WHOLE;
        m_records.push_back(record);
        record.position = 0;
        for (const store::Value& value : m_values) {
            record.type = store::typeOf(value);
            record.value = addressOf(value);
            m_records.push_back(record);
            ++record.position;
        }
        m_records.emplace_back();
    }

    Table(const Table&) = delete;
    Table& operator=(const Table&) = delete;

    /// The same with values that all differ from these.
    std::unique_ptr<Table> different() const {
        store::Elements elements;
        for (const store::Value& value : m_values) {
            elements.put(elements.count(), other(value));
        }
        return std::make_unique<Table>(m_key, elements);
    }

    void send(ComGUIManager& manager) {
        if (m_records.empty()) {
            const store::Value& value = m_values.front();
            check(manager.SetTicketParameter(3, job, m_key.c_str(), store::typeOf(value),
                                             addressOf(value), POSITION_WHOLE) == 0,
                  m_key.c_str());
        } else {
            check(manager.GetClientContainer()->SetMultiParameter(3, job, m_records.data()),
                  m_key.c_str());
        }
    }

  private:
    static const void* addressOf(const store::Value& value) {
        if (const auto* text = std::get_if<store::Text>(&value)) {
            return text->bytes->text.c_str();
        }
        const auto* number = std::get_if<int>(&value);
        return number != nullptr ? static_cast<const void*>(number) : &std::get<double>(value);
    }

    static store::Value other(const store::Value& value) {
        if (const auto* text = std::get_if<store::Text>(&value)) {
            return store::Text{std::make_shared<store::Bytes>(text->bytes->text + "x")};
        }
        const auto* number = std::get_if<int>(&value);
        return number != nullptr ? store::Value(*number + 1)
                                 : store::Value(std::get<double>(value) + 1);
    }

    std::string m_key;
    std::vector<store::Value> m_values;
    std::vector<SETMULTIPAR> m_records;
};

using Tables = std::vector<std::unique_ptr<Table>>;

Tables tablesOf(store::StoreEngine& engine) {
    Tables tables;
    const auto content = engine.content(3, job, store::KeyFilter());
    for (const auto& [key, elements] : content->keys()) {
        tables.push_back(std::make_unique<Table>(key, *elements));
    }
    return tables;
}

} // namespace

int main() {
    bench::keepFreedMemory();
    const support::SuiteRoot root;
    root.installPlistReader(PLIST_READER);
    root.installCommBundle(COMGUI_BUNDLE);
    setenv("TMPDIR", root.path().c_str(), 1); // For the processor's folder.
    const std::string address = root.path("store");
    store::makeStore(address, "Bench");
    const std::unique_ptr<store::StoreEngine> engine = store::openStore(address);
    engine->putUser({"bench", store::passwordHash("bench"), false});
    engine->create(3, job);

    KZVerifyJobProcessor processor;
    processor.m_connector =
        new CKZConnector(base::wideFromBytes(address), L"bench", L"bench", 0x5071103, false, false);
    check(processor.m_connector->IsLoggedIn(), "the login");
    ComGUIManager& manager = *processor.m_connector->getComGUIMngrInstance();

    const Measurement measurement;
    analyseResultsRecord results;
    for (int i = 0; i < resultValueCount; ++i) {
        results.values[i] = i / 7.0;
    }
    const auto writeBack = [&] {
        check(processor.CopyResulDataToJobTicket(job, measurement.job, results, false) == 0,
              "the write-back");
    };
    writeBack();
    const Tables tables = tablesOf(*engine);
    Tables others;
    for (const auto& table : tables) {
        others.push_back(table->different());
    }
    const auto send = [&](const Tables& all) {
        for (const auto& table : all) {
            table->send(manager);
        }
    };
    // Unchanged values are not written, so each side must find different values everywhere.
    double best = std::numeric_limits<double>::max();
    double bareBest = best;
    for (int round = 0; round < rounds; ++round) {
        send(others);
        best = std::min(best, secondsOf(writeBack));
        send(others);
        bareBest = std::min(bareBest, secondsOf([&] { send(tables); }));
    }
    std::printf("writing back %d patches with spectra, %zu keys %7.2f ms, %.2f times the bare "
                "%.2f ms (at most 2)\n",
                patches, tables.size(), best * 1e3, best / bareBest, bareBest * 1e3);
}
