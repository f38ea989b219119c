#include "companions/diagnosis/Diagnosis.h"

#include <algorithm>
#include <cctype>
#include <clocale>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <map>
#include <memory>
#include <optional>
#include <string_view>
#include <system_error>
#include <utility>

#include <langinfo.h>
#include <sys/stat.h>
#include <unistd.h>

#include <wx/debug.h>
#include <wx/log.h>

#include "ExitCodes.h"
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "base/WideBytes.h"
#include "companions/diagnosis/KeyRules.h"
#include "companions/diagnosis/ReadOnlyServer.h"
#include "job/KZVerifyJobProcessor.h"
#include "job/StripKeys.h"
#include "measure/Helper.h"
#include "platform/TemporaryFolder.h"

namespace diagnosis {

namespace {

namespace fs = std::filesystem;

constexpr int oneCodeForAll = 255; ///< What a run's -1 becomes as the exit code of a process.
constexpr int mostPatches = 1'000'000;

std::string bytesOf(const wxString& text) {
    return base::bytesFromWide(text.ToStdWstring());
}

std::string number(int value) {
    return std::to_string(value);
}

std::string fileName(const std::string& path) {
    return path.substr(path.rfind('/') + 1);
}

const ExitCodeText* textOf(int code) {
    const auto found = std::find_if(std::begin(exitCodeTexts), std::end(exitCodeTexts),
                                    [&](const ExitCodeText& text) { return text.code == code; });
    return found == std::end(exitCodeTexts) ? nullptr : &*found;
}

/// "22, An input is neither CGATS text nor an ICC profile. The first bytes are ..."
std::string explained(int code) {
    const ExitCodeText* const text = textOf(code);
    return number(code) + (text == nullptr
                               ? std::string()
                               : std::string(", ") + text->meaning + ". " + text->cause);
}

/// The temporary folder of this process until the object ends: what the tool writes goes there.
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

/// As the tool starts: texts and file names in the user's locale, and wx silent.
void prepareProcess() {
    const char* const locale = std::setlocale(LC_CTYPE, "");
    if (locale == nullptr || std::string_view(nl_langinfo(CODESET)) != "UTF-8") {
        std::setlocale(LC_CTYPE, "C.UTF-8");
    }
    wxDisableAsserts();
    wxLog::EnableLogging(false);
}

/// Names of a job's folder that the tool itself writes, and what becomes of a job's file there.
struct ReservedName {
    const char* name;
    std::vector<int> codes;
    bool spoilsResult;
    const char* consequence;
};

const std::vector<ReservedName>& reservedNames() {
    static const std::vector<ReservedName> all = {
        {"Measured sample.txt",
         {exitReferenceMissing, 38, exitSampleMissing},
         true,
         "The measurement is written to this name, so that it would be compared with itself."},
        {"Measured reference.txt",
         {},
         false,
         "References from the ticket are written to this name and replace the file."},
        {"NMPatchSetDefinition.it8",
         {exitReferenceMissing, exitMeasuringFailed},
         false,
         "The definition for the measuring tool has this name; it replaces the file and is removed "
         "after the measurement."},
        {"NMPatchSetDefinition.dcf",
         {exitReferenceMissing},
         false,
         "A definition for the measuring tool has this name and replaces the file."},
        {"output.json", {}, false, "The result is written to this name and replaces the file."},
        {"meta.json", {}, false, "The meta file is written to this name and replaces the file."},
    };
    return all;
}

/// The lesser of the distance of two keys and 3. Keys are short, so the plain table will do.
std::size_t distanceOf(const std::string& a, const std::string& b) {
    constexpr std::size_t far = 3;
    if (a.size() > b.size() + 2 || b.size() > a.size() + 2) {
        return far;
    }
    std::vector<std::size_t> row(b.size() + 1);
    for (std::size_t j = 0; j <= b.size(); ++j) {
        row[j] = j;
    }
    for (std::size_t i = 1; i <= a.size(); ++i) {
        std::size_t diagonal = std::exchange(row[0], i);
        for (std::size_t j = 1; j <= b.size(); ++j) {
            const bool same = std::tolower(static_cast<unsigned char>(a[i - 1])) ==
                              std::tolower(static_cast<unsigned char>(b[j - 1]));
            const std::size_t value =
                std::min({row[j] + 1, row[j - 1] + 1, diagonal + (same ? 0 : 1)});
            diagonal = std::exchange(row[j], value);
        }
    }
    return std::min(row[b.size()], far);
}

/// One examination, whose steps fill its result.
class Examination {
  public:
    Examination(const std::string& address, const Request& request)
        : m_address(address), m_request(request) {}

    Diagnosis result();

  private:
    void checkMachine();
    bool checkCall();
    bool openStore();
    bool logIn();
    bool checkList();
    void load();
    bool checkPreset();
    void compare();
    void measure();
    bool checkInputs();

    void judgeFiles();
    void judgeFile(const AskedFile& file);
    void judgeNames();
    void judgeValues();
    void judgeInstrument();
    void sortFindings();
    void listAsked();

    const AskedKey* asked(const std::string& key, int type = jobType) const;
    template<class T>
    const T* valueOf(const std::string& key, int type = jobType) const;
    std::string similarKey(const AskedKey& asked);
    bool wasAskedBefore(const std::string& key, std::size_t index) const;

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
    std::string m_temporaryFolder; ///< That of the user's runs, or empty.
    std::shared_ptr<store::StoreEngine> m_engine;
    std::unique_ptr<ReadOnlyServer> m_server;
    std::unique_ptr<KZVerifyJobProcessor> m_processor;
    KZJobDataStruct m_job;
    Strip m_strip = Strip::first;
    std::map<std::pair<int, int>, std::vector<std::string>> m_keyNames; ///< Of tickets.
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
        judgeFiles();
        judgeNames();
        judgeValues();
        m_processor->FreeMeasurementData(m_job);
        std::free(m_job.childJobIDs);
    }
    if (m_server != nullptr) {
        m_server->throwFailure();
        const std::vector<Finding> keys =
            judgeKeys(m_server->keys(), m_request.job, m_strip,
                      [this](const AskedKey& key) { return similarKey(key); });
        m_findings.insert(m_findings.begin(), keys.begin(), keys.end());
    }
    sortFindings();
    listAsked();
    checkMachine();
    m_processor.reset();
    return std::move(m_result);
}

/// What is wrong with this machine's installation. The client may run on another one.
void Examination::checkMachine() {
    const auto tell = [&](std::string where, std::string text, std::vector<int> codes) {
        m_result.machine.push_back({std::move(where), std::move(text), std::move(codes)});
    };
    const std::string bundle = base::bytesFromWide(ComGUIManager::PlugInPath());
    if (!fs::is_directory(bundle)) {
        tell(bundle, "is missing. Without the comm plug-in no login succeeds.",
             {exitLoginNoServer});
    }
    const std::string tool =
        m_result.measures ? bytesOf(Helper::GetNerovaMeasurePath(true)) : std::string();
    if (m_result.measures && access(tool.c_str(), X_OK) != 0) {
        tell(tool.empty() ? "measuring tool" : tool,
             "is missing or can't be executed. The job can't be measured.",
             {exitMeasuringFailed, exitSampleMissing});
    } else if (m_result.measures && Helper::IsNMRunning()) {
        tell(tool, "runs now. A second measurement can't start until it ends.",
             {exitMeasuringFailed});
    }
    const std::string viewer = bytesOf(Helper::GetNerovaVerifyPath().GetFullPath());
    if (access(viewer.c_str(), X_OK) != 0) {
        tell(viewer, "is missing or can't be executed. The result is written but not shown.",
             {exitViewerNotStarted});
    }
    const std::string& folder = m_temporaryFolder;
    if (folder.find_first_of("\"'\\") != std::string::npos ||
        folder.find("  ") != std::string::npos) {
        tell(folder,
             "contains a quote, a backslash or two blanks in a row: the viewer gets a wrong "
             "path and shows no page.",
             {});
    }
    struct stat status;
    const std::string working = folder + "/Tintgate";
    if (folder.empty() || (lstat(working.c_str(), &status) == 0 &&
                           (!S_ISDIR(status.st_mode) || status.st_uid != geteuid()))) {
        tell(folder.empty() ? "/tmp" : working,
             "is not a folder of this user. A run can keep no files.", {exitJdfMissing});
    }
}

bool Examination::checkCall() {
    const std::optional<int> selector = stripSelectorOf(base::wideFromBytes(m_request.selector));
    const std::string where = "strip selector " + m_request.selector;
    if (!selector) {
        add(m_request.selector.empty() ? "strip selector" : where,
            "is not a number. 0 is the first strip, 1 the second.", {exitWrongArguments});
        return end(exitWrongArguments);
    }
    m_job.secondStrip = *selector;
    m_strip = stripOf(*selector);
    if (*selector != 0 && *selector != 1) {
        add(where,
            "is neither 0, the first strip, nor 1, the second. The run reads the keys of the "
            "second "
            "strip, writes no result to the ticket and can close the job all the same.",
            {}, true);
    }
    constexpr std::size_t longestAddress = 127;
    if (m_address.size() > longestAddress || m_address.find(':') != std::string::npos) {
        add("store " + m_address,
            m_address.size() > longestAddress
                ? "has an address of more than 127 bytes, and a login carries no more."
                : "has an address with a \":\". A call keeps only what follows the last one.",
            {exitLoginNoServer});
        return end(exitLoginNoServer);
    }
    return true;
}

bool Examination::openStore() {
    try {
        m_engine = store::openStore(m_address);
    } catch (const store::StoreFailure& failure) {
        const int code = failure.fault == store::Fault::Newer   ? exitLoginServerNewer
                         : failure.fault == store::Fault::Older ? exitLoginServerOlder
                                                                : exitLoginNoServer;
        add("store " + m_address, std::string(failure.what()) + ".", {code});
        return end(code);
    }
    return true;
}

bool Examination::logIn() {
    const std::vector<store::User> users = m_engine->users();
    const auto named = std::find_if(users.begin(), users.end(), [&](const store::User& user) {
        return user.name == m_request.user;
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
        base::wideFromBytes(m_address), base::wideFromBytes(m_request.user), L"", anyApplication,
        true);
    if (m_processor->m_connector != nullptr) {
        return true;
    }
    const int* const version = valueOf<int>("System/Product/MajorVersion", systemType);
    if (version != nullptr) {
        add("system System/Product/MajorVersion",
            "is " + number(*version) + ". A login needs a server of version 5 or above.",
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
        const int* const value = valueOf<int>(key);
        const std::string problem = found == nullptr ? "is missing" : problemOf(*found, false);
        return value != nullptr ? "is " + number(*value) : problem;
    };
    const int* const type = valueOf<int>("Input/FileType");
    if (type != nullptr && *type == 4096) {
        add(jobKey("Input/FileType"), "is 4096, which keeps a job from being verified.", codes);
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
                ". A job is verified if the former is 208 or the latter 1. A job that lacks a key "
                "is "
                "judged by the value of the job that precedes it.",
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
        const auto& files = m_server->files();
        const auto file = std::find_if(files.begin(), files.end(), [&](const AskedFile& asked) {
            return asked.localPath == bytesOf(m_job.tolerance.filePath);
        });
        add("file " + (file == files.end() ? std::string() : file->serverPath),
            "is the preset, and the library refuses it with " + explained(code) + ".",
            {exitPresetFailed});
    }
    return end(exitPresetFailed);
}

/// Names which of the two compared files can't be used by itself. True if both can.
bool Examination::checkInputs() {
    bool sound = true;
    for (const auto& [path, what] : {std::pair(m_job.referenceFile, "reference"),
                                     std::pair(m_job.sampleFile, "measurement")}) {
        if (!fs::is_regular_file(bytesOf(path))) {
            continue;
        }
        const int code = validateInputFile(path.ToStdWstring());
        if (code != 0) {
            const auto& files = m_server->files();
            const auto file = std::find_if(files.begin(), files.end(), [&](const AskedFile& asked) {
                return asked.localPath == bytesOf(path);
            });
            add(file == files.end() ? fileName(bytesOf(path)) : "file " + file->serverPath,
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
            "is " + number(m_job.measurement.numPatches) +
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
        const bool dynamic = m_job.useDynstrip == 1 && m_strip == Strip::first;
        add("control strip " + fileName(bytesOf(strip)),
            std::string("No definition for the measuring tool can be made from it: ") +
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
        fs::remove(bytesOf(definition), ignored); // As after a measurement.
    }
    if (!fs::is_regular_file(bytesOf(m_job.referenceFile))) {
        end(exitReferenceMissing);
    } else if (!checkInputs()) {
        end(m_findings.back().codes.front());
    }
}

const AskedKey* Examination::asked(const std::string& key, int type) const {
    const auto& keys = m_server->keys();
    const auto found = std::find_if(keys.begin(), keys.end(), [&](const AskedKey& asked) {
        return asked.type == type && asked.key == key &&
               (type != jobType || asked.id == m_request.job);
    });
    return found == keys.end() ? nullptr : &*found;
}

/// The value that a read has given. Null if it was not asked or not found.
template<class T>
const T* Examination::valueOf(const std::string& key, int type) const {
    const AskedKey* const found = asked(key, type);
    return found == nullptr || !found->found ? nullptr : std::get_if<T>(found->stored->first());
}

/// A key of the ticket that nobody asks for and that differs from this one in at most two letters,
/// or is that of the other strip.
std::string Examination::similarKey(const AskedKey& wanted) {
    auto& names = m_keyNames[{wanted.type, wanted.id}];
    if (names.empty()) {
        const auto content = m_engine->content(wanted.type, wanted.id, store::KeyFilter());
        if (content != nullptr) {
            for (const auto& [key, elements] : content->keys()) {
                names.push_back(key);
            }
        }
    }
    std::string best;
    std::size_t least = 3;
    for (const std::string& name : names) {
        const bool isAsked = std::any_of(
            m_server->keys().begin(), m_server->keys().end(), [&](const AskedKey& asked) {
                return asked.key == name && asked.type == wanted.type && asked.id == wanted.id;
            });
        const std::size_t distance = isAsked ? least : distanceOf(wanted.key, name);
        if (distance < least) {
            least = distance;
            best = name;
        }
    }
    return best;
}

bool Examination::wasAskedBefore(const std::string& key, std::size_t index) const {
    const auto& keys = m_server->keys();
    return std::any_of(keys.begin(), keys.begin() + static_cast<std::ptrdiff_t>(index),
                       [&](const AskedKey& asked) { return asked.key == key; });
}

void Examination::judgeFiles() {
    for (const AskedFile& file : m_server->files()) {
        if (!file.problem.empty()) {
            judgeFile(file);
        }
    }
}

void Examination::judgeFile(const AskedFile& file) {
    struct Role {
        const char* key; ///< The key that names the file, as the first strip has it.
        const char* what;
        std::vector<int> codes;
        bool spoilsResult;
    };
    static const Role roles[] = {
        {"Output/Jdf/FileName", "JDF", {exitJdfMissing}, false},
        {"System/Folders/Temp", "JDF", {exitJdfMissing}, false},
        {"Workflow/RemoteOutFolder", "JDF", {exitJdfMissing}, false},
        {"Remote/JDFName", "JDF", {exitJdfMissing}, false},
        {"Footer/Dynstrip/IT8", "dynamic control strip", {exitMeasuringFailed, 20}, false},
        {"Footer/Dynstrip/File", "picture of the dynamic strip, which no run needs", {}, false},
        {"Footer/ControlstripIT8", "control strip", {exitMeasuringFailed}, false},
        {"Footer/ControlstripFile", "control strip", {exitMeasuringFailed}, false},
        {"Footer/Nesting/ControlstripFile", "control strip", {exitMeasuringFailed}, false},
    };
    const std::string preset = "/tickets/" + bytesOf(m_job.presetFile);
    Role role = {nullptr, "reference", {exitReferenceMissing, 20}, false};
    const bool readsReferences = wasAskedBefore("Workflow/Name", file.asked) &&
                                 !wasAskedBefore("Footer/ControlstripIT8", file.asked);
    if (!m_job.presetFile.empty() && file.serverPath.ends_with(preset)) {
        role = {nullptr, "preset", {exitPresetFailed}, false};
    } else if (file.serverPath.ends_with(".dcf")) {
        return; // The definition beside a dynamic strip is optional.
    } else if (wasAskedBefore("Footer/Nesting/PSDAssessment", file.asked) &&
               !wasAskedBefore("Output/Jdf/FileName", file.asked)) {
        role = {nullptr,
                "strip that the parent's jobs share; the job uses its own, and the result goes to "
                "this job alone",
                {},
                true};
    } else if (!readsReferences || wasAskedBefore("Output/Jdf/FileName", file.asked)) {
        for (const Role& known : roles) {
            if (file.namedBy == known.key || file.namedBy == stripKey(m_strip, known.key)) {
                role = known;
            }
        }
    }
    add("file " + file.serverPath,
        "does not come: " + file.problem + ". It is the " + role.what +
            (role.what == std::string_view("preset") || file.namedBy.empty()
                 ? ""
                 : ", named by " + file.namedBy) +
            ".",
        role.codes, role.spoilsResult);
}

/// All files of a job come into one folder under the last parts of their paths.
void Examination::judgeNames() {
    std::map<std::string, std::string> first; // Local name to server path.
    for (const AskedFile& file : m_server->files()) {
        const std::string name = fileName(file.localPath);
        for (const ReservedName& reserved : reservedNames()) {
            const bool isOwn = file.serverPath.ends_with(".dcf"); // Brought for this very name.
            if (name == reserved.name && !isOwn) {
                add("file " + file.serverPath,
                    "has a name that is reserved in the job's folder. " +
                        std::string(reserved.consequence),
                    reserved.codes, reserved.spoilsResult);
            }
        }
        const auto [other, isNew] = first.emplace(name, file.serverPath);
        if (!isNew && other->second != file.serverPath) {
            // A comparison needs the reference alone, which only nesting and the JDF come after.
            const bool spoils = m_result.measures || wasAskedBefore("General/ParentID", file.asked);
            add("file " + file.serverPath,
                "has the same name as " + other->second +
                    ". In the job's folder the one that comes later replaces the other.",
                {exitReferenceMissing, exitMeasuringFailed, exitPresetFailed}, spoils);
        }
    }
}

void Examination::judgeValues() {
    const auto workflowKey = stripKey(m_strip, "Workflow/Verify/MeasurementWorkflow");
    const int* const workflow = valueOf<int>(workflowKey);
    const int* const esko = valueOf<int>("Job/FromEsko");
    const bool isEsko = esko != nullptr && *esko == 1;
    const bool isDynamic = m_job.useDynstrip == 1 && m_strip == Strip::first;
    if (workflow != nullptr && (*workflow < 1 || *workflow > 3) && !isDynamic &&
        !(isEsko && *workflow == 4)) {
        add(jobKey(workflowKey),
            "is " + number(*workflow) +
                ". References come with 1 (profile), 2 (characterisation data), 3 (ticket or "
                "profile), and with 4 if Job/FromEsko is 1. Without references the preset is not "
                "loaded.",
            {exitPresetFailed});
    }
    for (const char* name : {"Reference/Numpatches", "Numpatches"}) {
        const int* const patches = valueOf<int>(measurementKey(m_strip, name));
        if (patches != nullptr && *patches > mostPatches) {
            add(jobKey(measurementKey(m_strip, name)),
                "is " + number(*patches) + ". More than 1,000,000 patches are not loaded.",
                {exitPresetFailed, exitSampleMissing});
        }
    }
    const int* const length = valueOf<int>(measurementKey(m_strip, "SpectralValues/Length"));
    if (length != nullptr && (*length < 0 || *length > spectralValueCount)) {
        add(jobKey(measurementKey(m_strip, "SpectralValues/Length")),
            "is " + number(*length) +
                ", not 0 to 36. The measurement counts as one without spectra.");
    }
    const int* const formula = valueOf<int>(stripKey(m_strip, "Workflow/Verify/DeltaEMode"));
    if (formula != nullptr && *formula != 0 && (*formula < 2 || *formula > 5)) {
        add(jobKey(stripKey(m_strip, "Workflow/Verify/DeltaEMode")),
            "is " + number(*formula) +
                ", which counts as CIE76. The formulas are 0, 2, 3, 4 and 5.",
            {}, true);
    }
    if (valueOf<int>(stripKey(m_strip, "Workflow/Verify/ComparisonMethod")) != nullptr &&
        !m_engine->exists(presetType, m_job.presetID)) {
        add(jobKey(stripKey(m_strip, "Workflow/Verify/ComparisonMethod")),
            "is " + number(m_job.presetID) + ", but there is no ticket " +
                ticketName(presetType, m_job.presetID) + ".",
            {exitPresetFailed});
    }
    const int* const active = valueOf<int>("Workflow/Verify/Active");
    if (m_strip == Strip::second && (active == nullptr || *active != 3)) {
        add(jobKey("Workflow/Verify/Active"), "is not 3: the job counts as one with a single "
                                              "strip, and a run on the second closes it.");
    }
    const auto status = measurementKey(m_strip, "Status");
    if (m_result.measures && !m_request.remeasure && m_job.measurementStatus < 1 &&
        m_engine->key(jobType, m_request.job, measurementKey(m_strip, "Numpatches")) != nullptr) {
        add(jobKey(status),
            "is missing or 0, so that the job is measured although the ticket has " +
                measurementKey(m_strip, "Numpatches") + ".");
    }
    judgeInstrument();
}

/// A control strip whose instrument can't be read.
void Examination::judgeInstrument() {
    if (m_job.deviceID != 0 || m_job.controlStripFile.empty() || m_job.useDynstrip == 1) {
        return;
    }
    std::ifstream strip(bytesOf(m_job.controlStripFile));
    std::string line;
    std::string found = "no line has the word DEVICE";
    while (std::getline(strip, line)) {
        if (line.find("DEVICE") != std::string::npos) {
            line.erase(std::find_if(line.begin(), line.end(),
                                    [](unsigned char c) { return c < ' ' && c != '\t'; }),
                       line.end());
            found = "the first line with the word DEVICE is \"" + line +
                    "\", and has to be the word, "
                    "one blank and a number";
            break;
        }
    }
    const bool isInline = m_job.inlineVerifyJob == 1;
    add("control strip " + fileName(bytesOf(m_job.controlStripFile)),
        "The number of the instrument reads as 0: " + found + "." +
            (isInline ? " With sub type 96 such a job counts as one that an inline instrument has "
                        "measured: it is compared and never measured."
                      : ""),
        isInline ? std::vector<int>{exitStoredDataFailed, exitSampleMissing} : std::vector<int>{});
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
                answer = number(key.stored->count()) + " elements";
            } else if (const int* const whole = std::get_if<int>(&value)) {
                answer = number(*whole);
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
