// SPDX-License-Identifier: Apache-2.0
#include "measure/MeasuringTool.h"

#include <filesystem>
#include <fstream>
#include <limits>
#include <string>
#include <system_error>

#include <unistd.h>

#include <wx/filename.h>

#include "base/WholeFile.h"
#include "job/JobRecords.h"
#include "measure/DefinitionFile.h"
#include "measure/Helper.h"
#include "measure/NerovaMeasureParams.h"
#include "measure/Paths.h"

namespace {

namespace fs = std::filesystem;

enum Outcome {
    Done = 0,
    AlreadyRunning = -1,
    NotStarted = -2,
    NoControlStrip = -3,
    NoDefinition = -4,
    NoDefinitionPath = -5,
};

constexpr int codeOfRunningTool = 1015;

constexpr int anyLanguage = 57;
constexpr struct {
    const char* language;
    int number;
} languages[] = {
    {"en_US", 59},  {"fr_FR", 79},  {"it_IT", 109}, {"ja_JP", 111}, {"zh_TW", 45},  {"zh_CN", 46},
    {"ko_KR", 124}, {"de_DE", 88},  {"es_ES", 179}, {"pt_BR", 154}, {"pt_PT", 153}, {"nl_NL", 55},
    {"ru_RU", 159}, {"tr_TR", 214}, {"cs_CZ", 53},  {"pl_PL", 152},
};

void removeFile(const wxString& path) {
    unlink(measure::pathBytes(path).c_str());
}

/// Handles a control strip with the definition's name, or a link to it: the definition replaces it
/// temporarily, and the destructor restores its bytes.
class ReplacedStrip {
  public:
    explicit ReplacedStrip(const wxString& strip) : m_path(measure::pathBytes(strip)) {
        const wxString definition = measure::pathBeside(strip, measure::definitionName);
        std::error_code ignored;
        m_isReplaced = fs::equivalent(m_path, measure::pathBytes(definition), ignored);
        if (m_isReplaced) {
            base::readWholeFile(m_path, std::numeric_limits<std::size_t>::max(), m_bytes);
        }
    }
    ~ReplacedStrip() {
        if (m_isReplaced) {
            std::ofstream(m_path, std::ios::binary) << m_bytes;
        }
    }
    ReplacedStrip(const ReplacedStrip&) = delete;
    ReplacedStrip& operator=(const ReplacedStrip&) = delete;

    explicit operator bool() const { return m_isReplaced; }

  private:
    const std::string m_path;
    std::string m_bytes;
    bool m_isReplaced = false;
};

wxString instrumentOf(const wxString& definition) {
    wxString name;
    return getDeviceNameFromIt8ControlStripFile(definition, &name) == 0 ? name : "Unknown";
}

/// Runs the tool. On failure, removes the samples.
Outcome launch(const NerovaMeasureParams& params) {
    int exitCode = 0;
    if (Helper::LaunchNerovaMeasure(params, exitCode, true) && exitCode == 0) {
        return Done;
    }
    removeFile(params.o);
    return exitCode == -1 || exitCode == codeOfRunningTool ? AlreadyRunning : NotStarted;
}

} // namespace

int GetLanguageID(KZJobDataStruct* job) {
    for (const auto& [language, number] : languages) {
        if (job->language == language) {
            return number;
        }
    }
    return anyLanguage;
}

int measure::measureStrip(KZJobDataStruct& job) {
    const wxString& controlStrip = job.controlStripFile;
    if (controlStrip.empty()) {
        return NoControlStrip;
    }
    const ReplacedStrip replacedStrip(controlStrip);
    const wxString definition = writeDefinition(controlStrip, job);
    if (definition.empty()) {
        return NoDefinition;
    }
    removeFile(job.sampleFile); // An old one must not be mistaken for a new one.
    NerovaMeasureParams params;
    params.apnm = "Nerova Verify";
    params.l = wxString::Format("%d", GetLanguageID(&job));
    params.createchart4meas = "False";
    params.patchname = wxFileName(controlStrip).GetFullName();
    params.patch = definition;
    if (params.patch.empty()) {
        return NoDefinitionPath;
    }
    params.i = instrumentOf(definition);
    params.m = "measure";
    params.o = job.sampleFile;
    params.forcemeasure = "True";
    const Outcome outcome = launch(params);
    if (!replacedStrip) {
        removeFile(definition);
    }
    return outcome;
}
