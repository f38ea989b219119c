// SPDX-License-Identifier: Apache-2.0
#include "companions/diagnosis/Diagnosis.h"

#include <algorithm>
#include <clocale>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <optional>
#include <string_view>
#include <system_error>
#include <utility>

#include <langinfo.h>
#include <unistd.h>

#include <wx/debug.h>
#include <wx/log.h>

#include "ExitCodes.h"
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "base/WideBytes.h"
#include "companions/diagnosis/FileRules.h"
#include "companions/diagnosis/KeyRules.h"
#include "companions/diagnosis/Machine.h"
#include "companions/diagnosis/ReadOnlyServer.h"
#include "companions/diagnosis/SimilarKeys.h"
#include "companions/diagnosis/ValueRules.h"
#include "companions/diagnosis/Words.h"
#include "job/KZVerifyJobProcessor.h"
#include "jobkeys/JobState.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/StripKeys.h"
#include "platform/TemporaryFolder.h"

namespace diagnosis {

namespace {

namespace fs = std::filesystem;

constexpr int oneCodeForAll = 255; ///< The process exit code for a run's result of -1.

/// Replaces this process's temporary folder until the object is destroyed; the tool writes there.
class PrivateTemporaryFolder {
  public:
    explicit PrivateTemporaryFolder(const std::string& usual)
        : m_path((usual.empty() ? "/tmp" : usual) + "/tintgate-diagnose-XXXXXX") {
        if (mkdtemp(m_path.data()) == nullptr) {
            throw fs::filesystem_error("no folder for the diagnosis", m_path,
                                       std::error_code(errno, std::generic_category()));
        }
        setenv("TMPDIR", m_path.c_str(), 1);
    }
    ~PrivateTemporaryFolder() {
        std::error_code ignored;
        fs::remove_all(m_path, ignored);
    }
    PrivateTemporaryFolder(const PrivateTemporaryFolder&) = delete;
    PrivateTemporaryFolder& operator=(const PrivateTemporaryFolder&) = delete;

  private:
    std::string m_path;
};

/// Same setup as in the tool: texts and file names in the user's locale, and wx silent.
void prepareProcess() {
    const char* const locale = std::setlocale(LC_CTYPE, "");
    if (locale == nullptr || std::string_view(nl_langinfo(CODESET)) != "UTF-8") {
        std::setlocale(LC_CTYPE, "C.UTF-8");
    }
    wxDisableAsserts();
    wxLog::EnableLogging(false);
}

/// One examination. Its steps fill the result.
class Examination {
  public:
    Examination(const std::string& address, const Request& request)
        : m_address(address), m_request(request) {}

    Diagnosis result();

  private:
    bool checkCall();
    bool openStore();
    bool logIn();
    bool checkList();
    void load();
    bool checkPreset();
    void compare();
    void measure();
    bool checkInputs();
    void checkPairing();

    void judgeReads();
    void sortFindings();
    void listAsked();

    const AskedKey* asked(const std::string& key) const {
        return findKey(m_server->keys(), jobType, m_request.job, key);
    }
    /// "file /server/x" for a downloaded file, otherwise the name of the local file.
    std::string placeOf(const wxString& local) const;

    void add(std::string where, std::string text, std::vector<int> codes = {},
             bool spoilsResult = false) {
        m_findings.push_back({std::move(where), std::move(text), std::move(codes), spoilsResult});
    }
    std::string jobKey(const std::string& key) const {
        return ticketName(jobType, m_request.job) + " " + key;
    }
    bool end(int code) {
        m_result.code = code < 0 ? oneCodeForAll : code;
        return false;
    }

    const std::string m_address;
    const Request m_request;
    std::string m_temporaryFolder; ///< The folder that the user's runs use, or empty.
    std::shared_ptr<store::StoreEngine> m_engine;
    std::unique_ptr<ReadOnlyServer> m_server;
    std::unique_ptr<KZVerifyJobProcessor> m_processor;
    KZJobDataStruct m_job;
    Strip m_strip = Strip::First;
    std::vector<Finding> m_findings;
    Diagnosis m_result;
};

Diagnosis Examination::result() {
    m_temporaryFolder = platform::temporaryFolder();
    const PrivateTemporaryFolder folder(m_temporaryFolder);
    prepareProcess();
    if (checkCall() && openStore() && logIn() && checkList()) {
        load();
        m_server->removePlaceholder();
        if (m_result.code == exitDone && checkPreset()) {
            m_result.measures = !KZVerifyJobProcessor::IsToBeCompared(m_job, m_request.remeasure);
            m_result.measures ? measure() : compare();
        }
        m_server->removePlaceholder();
        m_server->throwFailure();
        judgeReads();
        m_processor->FreeMeasurementData(m_job);
        std::free(m_job.childJobIDs);
    } else if (m_server != nullptr) {
        m_server->throwFailure();
        judgeReads();
    }
    sortFindings();
    listAsked();
    m_result.machine = judgeMachine(m_temporaryFolder, m_result.measures);
    m_processor.reset();
    return std::move(m_result);
}

bool Examination::checkCall() {
    const std::optional<int> selector =
        jobkeys::stripSelectorOf(base::wideFromBytes(m_request.selector));
    const std::string where = "strip selector " + m_request.selector;
    if (!selector) {
        add(m_request.selector.empty() ? "strip selector" : where,
            "is not a number. 0 is the first strip, 1 the second.", {exitWrongArguments});
        return end(exitWrongArguments);
    }
    m_job.secondStrip = *selector;
    m_strip = jobkeys::stripOf(*selector);
    if (*selector != 0 && *selector != 1) {
        add(where,
            "is neither 0, the first strip, nor 1, the second. The run reads the keys of the "
            "second strip and writes no result to the ticket, but can still close the job.",
            {}, true);
    }
    constexpr std::size_t longestAddress = 127;
    if (m_address.size() > longestAddress || m_address.find(':') != std::string::npos) {
        add("store " + m_address,
            m_address.size() > longestAddress
                ? "has an address of more than 127 bytes, the limit of a login."
                : "has an address with a \":\". A run uses only the text after the last one.",
            {exitLoginNoServer});
        return end(exitLoginNoServer);
    }
    return true;
}

bool Examination::openStore() {
    try {
        m_engine = store::openStore(m_address);
    } catch (const store::StoreFailure& failure) {
        const int code = failure.status == store::Fault::Newer   ? exitLoginServerNewer
                         : failure.status == store::Fault::Older ? exitLoginServerOlder
                                                                 : exitLoginNoServer;
        add("store " + m_address, std::string(failure.what()) + ".", {code});
        return end(code);
    }
    return true;
}

bool Examination::logIn() {
    const std::vector<store::User> users = m_engine->users();
    const auto named = std::find_if(users.begin(), users.end(), [&](const store::User& user) {
        return user.name == m_request.login;
    });
    const bool anybody = std::any_of(users.begin(), users.end(),
                                     [](const store::User& user) { return !user.disabled; });
    if (!anybody) {
        add("users of the store",
            users.empty() ? "There is none, so nobody can log in." : "All of them are disabled.",
            {users.empty() ? exitLoginRefused : exitLoginDisabled});
        return end(m_findings.back().codes.front());
    }
    if (!m_request.user.empty() && (named == users.end() || named->disabled)) {
        const bool isThere = named != users.end();
        add("user " + m_request.user, isThere ? "is disabled." : "is not a user of the store.",
            {isThere ? exitLoginDisabled : exitLoginRefused});
        return end(m_findings.back().codes.front());
    }
    m_server = std::make_unique<ReadOnlyServer>(m_engine);
    ComGUIManager::UseInterface(m_server->interface());
    m_processor = std::make_unique<KZVerifyJobProcessor>();
    constexpr int anyApplication = 0;
    m_processor->m_connector = m_processor->ConnectToKZWithLoginCredentials(
        base::wideFromBytes(m_address), L"", L"", anyApplication, true);
    if (m_processor->m_connector != nullptr) {
        return true;
    }
    const std::optional<int> version =
        numberIn(findKey(m_server->keys(), systemType, 0, "System/Product/MajorVersion"));
    if (version) {
        add("system System/Product/MajorVersion",
            "is " + std::to_string(*version) + ". A login needs a server of version 5 or later.",
            {exitLoginRefused});
    }
    return end(exitLoginRefused);
}

bool Examination::checkList() {
    int* ids = nullptr;
    int count = 0;
    m_processor->m_connector->GetVerifierJobTicketIDs(&ids, &count, m_request.remeasure);
    const bool isListed = std::find(ids, ids + count, m_request.job) != ids + count;
    std::free(ids);
    if (isListed) {
        return true;
    }
    const std::vector<int> codes = {exitJobNotListed};
    if (!m_engine->exists(jobType, m_request.job)) {
        add(ticketName(jobType, m_request.job), "There is no such ticket.", codes);
        return end(exitJobNotListed);
    }
    const auto text = [&](const char* key) {
        const AskedKey* const found = asked(key);
        const std::optional<int> value = numberIn(found);
        return value              ? "is " + std::to_string(*value)
               : found == nullptr ? "is missing"
                                  : problemOf(*found, false);
    };
    if (numberIn(asked(jobkeys::fileTypeKey)) == jobkeys::unsuitableFileType) {
        add(jobKey("Input/FileType"), "is 4096. Jobs of this type are not verified.", codes);
    }
    const std::string status = text("Job/Display/Status");
    if (m_request.remeasure) {
        add(jobKey("Job/Display/Status"),
            status + ". A job is measured again if this is 209 to 212, or if it is 208 and "
                     "Workflow/Verify/Active is 3.",
            codes);
    } else {
        add(jobKey("Job/Display/Status"),
            status + ", and Remote/ShowInVerifier " + text("Remote/ShowInVerifier") +
                ". A job is verified if the former is 208 or the latter 1. A missing key "
                "counts as the value of the preceding job.",
            codes);
    }
    return end(exitJobNotListed);
}

void Examination::load() {
    end(m_processor->LoadKZJobData(m_request.job, &m_job));
}

bool Examination::checkPreset() {
    const int code = parsePresetParameterXMLFile(m_job.tolerance.filePath.ToStdWstring(),
                                                 &m_job.tolerance, true);
    if (code == 0) {
        return true;
    }
    if (!m_job.tolerance.filePath.empty()) {
        add(placeOf(m_job.tolerance.filePath),
            "is the preset, and the library refuses it with " + explained(code) + ".",
            {exitPresetFailed});
    }
    return end(exitPresetFailed);
}

/// Reports the compared files that can't be used at all. True if both can.
bool Examination::checkInputs() {
    bool sound = true;
    for (const auto& [path, what] : {std::pair(m_job.referenceFile, "reference"),
                                     std::pair(m_job.sampleFile, "measurement")}) {
        if (!fs::is_regular_file(bytesOf(path))) {
            continue;
        }
        const int code = validateInputFile(path.ToStdWstring());
        if (code != 0) {
            add(placeOf(path),
                std::string("is the ") + what + ", and the library refuses it with " +
                    explained(code) + ".",
                {code});
            sound = false;
        }
    }
    return sound;
}

void Examination::compare() {
    std::wstring json;
    const int code = m_processor->CompareStoredData(&m_job, &json);
    end(code);
    if (code == exitSampleMissing) {
        add(jobKey(measurementKey(m_strip, "Numpatches")),
            "is " + std::to_string(m_job.measurement.numPatches) +
                ". A stored measurement needs 1 to 1,000,000 patches.",
            {exitSampleMissing});
    } else if (code != exitDone && code != exitStoredDataFailed && checkInputs() &&
               !m_job.referenceFile.empty()) {
        add("comparison", "The library refuses it with " + explained(code) + ".", {code});
    }
}

void Examination::measure() {
    const wxString strip = m_job.controlStripFile;
    if (strip.empty()) {
        end(exitMeasuringFailed);
        return;
    }
    const wxString definition = m_processor->WriteTemporaryMeasurementDefinitionFile(strip, &m_job);
    if (definition.empty()) {
        const bool dynamic = jobkeys::isDynamic(m_strip, m_job.useDynstrip);
        add("control strip " + fileName(bytesOf(strip)),
            std::string("No definition for the measuring tool can be created from it: ") +
                (dynamic ? "a dynamic strip needs NUMBER_OF_STRIPS and NUMBER_OF_COLS"
                         : "a strip needs NUMBER_OF_COLS, or both NUMBER_OF_SETS and "
                           "NUMBER_OF_STRIPS") +
                " of 1 or more, each at the start of its line.",
            {exitMeasuringFailed});
        end(exitMeasuringFailed);
        return;
    }
    if (definition != strip) {
        std::error_code ignored;
        fs::remove(bytesOf(definition), ignored); // As the run does after a measurement.
    }
    if (!fs::is_regular_file(bytesOf(m_job.referenceFile))) {
        end(exitReferenceMissing);
    } else if (!checkInputs()) {
        end(m_findings.back().codes.front());
    } else {
        checkPairing();
    }
}

/// The strip's file has the device values that the measurement will have, but need not have
/// colours. So only the library's answer on pairing counts.
void Examination::checkPairing() {
    std::wstring ignored;
    const int code = analyzeMeasurements(m_job.referenceFile.ToStdWstring(),
                                         m_job.controlStripFile.ToStdWstring(), std::wstring(),
                                         m_job.tolerance, nullptr, &ignored, nullptr);
    if (code == exitNothingToPair || code == exitNoDeviceValues) {
        add("control strip " + fileName(bytesOf(m_job.controlStripFile)),
            "does not match the reference " + fileName(bytesOf(m_job.referenceFile)) +
                ": the library refuses them with " + explained(code) + ".",
            {code});
        end(code);
    }
}

std::string Examination::placeOf(const wxString& local) const {
    const std::string path = bytesOf(local);
    const auto& files = m_server->files();
    // If files have the same name, the last one remains.
    const auto file = std::find_if(files.rbegin(), files.rend(),
                                   [&](const AskedFile& asked) { return asked.localPath == path; });
    return file == files.rend() ? fileName(path) : "file " + file->serverPath;
}

/// Keys first: missing keys explain most of the rest.
void Examination::judgeReads() {
    SimilarKeys similar(*m_engine, m_server->keys());
    const auto append = [&](std::vector<Finding> findings) {
        m_findings.insert(m_findings.end(), findings.begin(), findings.end());
    };
    std::vector<Finding> earlier = std::exchange(m_findings, {});
    append(judgeKeys(m_server->keys(), m_request.job, m_strip,
                     [&](const AskedKey& key) { return similar.like(key); }));
    append(std::move(earlier));
    append(judgeFiles(*m_server, m_job, m_result.measures));
    append(judgeValues({.server = *m_server,
                        .engine = *m_engine,
                        .job = m_job,
                        .measures = m_result.measures,
                        .remeasure = m_request.remeasure}));
}

void Examination::sortFindings() {
    for (Finding& finding : m_findings) {
        const bool isCause = m_result.code != exitDone &&
                             std::count(finding.codes.begin(), finding.codes.end(), m_result.code);
        auto& list = isCause                                             ? m_result.causes
                     : finding.spoilsResult && m_result.code == exitDone ? m_result.spoilers
                                                                         : m_result.notices;
        list.push_back(std::move(finding));
    }
    if (m_result.code != exitDone && m_result.causes.empty()) {
        m_result.causes.push_back(
            {.where = "run", .text = explained(m_result.code) + ".", .codes = {m_result.code}});
    }
}

void Examination::listAsked() {
    if (m_server == nullptr) {
        return;
    }
    const auto& keys = m_server->keys();
    const auto& files = m_server->files();
    auto file = files.begin();
    const auto listFiles = [&](std::size_t before) {
        for (; file != files.end() && file->asked <= before; ++file) {
            m_result.asked.push_back(
                {"file " + file->serverPath, file->problem.empty() ? "came" : file->problem});
        }
    };
    for (std::size_t i = 0; i < keys.size(); ++i) {
        listFiles(i);
        const AskedKey& key = keys[i];
        if (key.type == jobType && key.id != m_request.job) {
            continue;
        }
        std::string answer = problemOf(key, false);
        if (answer.empty()) {
            const store::Value& value = *key.stored->first();
            if (key.isArray) {
                answer = std::to_string(key.stored->count()) + " elements";
            } else if (const int* const whole = std::get_if<int>(&value)) {
                answer = std::to_string(*whole);
            } else if (const auto* const text = std::get_if<store::Text>(&value)) {
                answer = '"' + text->bytes->text + '"';
            }
        }
        m_result.asked.push_back({keyName(key), answer});
    }
    listFiles(keys.size());
}

} // namespace

Diagnosis diagnose(const std::string& address, const Request& request) {
    return Examination(address, request).result();
}

} // namespace diagnosis
