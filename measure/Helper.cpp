// SPDX-License-Identifier: Apache-2.0
#include "measure/Helper.h"

#include <array>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>
#include <system_error>
#include <thread>
#include <vector>

#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <wx/cmdline.h>
#include <wx/filefn.h>
#include <wx/utils.h>

#include "base/WideBytes.h"
#include "measure/MeasureOptions.h"
#include "platform/CoreFoundationStrings.h"
#include "platform/Processes.h"
#include "platform/SystemRoot.h"

namespace {

constexpr const char* suitePlist = "//Library/Preferences/Qen/com.qen.packageversion.plist";
constexpr const char* measurePlists[] = {
    "//Library/Preferences/ApplicationsUsingNerovaMeasure_x64.plist",
    "//Library/Preferences/ApplicationsUsingNerovaMeasure.plist",
};
constexpr const char* familyFolder = "/Applications/Nerova";
constexpr const char* measureBundle = "/NerovaMeasure.app";

// In this installation, the suite's applications are our companions. The other rows are free.
constexpr std::array<const char*, 28> siblingApplications = {
    "NerovaMeasure",
    "Nerova Verify",
    "Plistbuddy",
    "tintgate-store",
};

wxString textFromBytes(const std::string& bytes) {
    return base::wideFromBytes(bytes);
}

std::string bytesFromText(const wxString& text) {
    return base::bytesFromWide(text.ToStdWstring());
}

wxString underRoot(const char* literal) {
    return textFromBytes(platform::underRoot(literal));
}

// With a root, the command word is quoted, because a root may contain blanks.
wxString plistCommandWord() {
    const wxString word = underRoot("/usr/libexec/Plistbuddy");
    return platform::systemRoot().empty() ? word : "\"" + word + "\"";
}

// The first line of a command's output, up to 255 bytes. Empty if there is none (C69).
std::string firstLineOf(const std::string& command) {
    FILE* const pipe = popen(command.c_str(), "r");
    if (pipe == nullptr) {
        return {};
    }
    char line[256] = "";
    // SIGCHLD of another child may interrupt the read.
    while (std::fgets(line, sizeof line, pipe) == nullptr) {
        line[0] = '\0';
        if (std::ferror(pipe) == 0 || errno != EINTR) {
            break;
        }
        std::clearerr(pipe);
    }
    pclose(pipe);
    return line;
}

bool isFolder(const wxString& path) {
    return !path.empty() && wxFileName::DirExists(path);
}

// Whether the folder contains this name. Tests for a regular file although the names are bundles,
// so only the property lists have an effect (C68).
bool holds(const wxString& folder, const char* name) {
    return wxFileExists(folder + name);
}

std::string nameOfProcess(const ProcessSerialNumber& process) {
    CFStringRef name = nullptr;
    CopyProcessName(&process, &name);
    char text[8192] = "";
    if (name != nullptr && !CFStringGetCString(name, text, sizeof text, kCFStringEncodingUTF8)) {
        text[0] = '\0';
    }
    CFRelease(name);
    return text;
}

int siblingsOfName(const std::string& name) {
    int count = 0;
    for (const char* sibling : siblingApplications) {
        count += sibling != nullptr && name == sibling ? 1 : 0;
    }
    return count;
}

// Checks the running applications once and returns the number of matches. With a name, stops at the
// first match.
int countApplications(const wxString& wanted, bool kill) {
    const wxCharBuffer narrow = wanted.mb_str(wxConvLibc);
    const std::string wantedBytes = narrow.data() == nullptr ? "" : narrow.data();
    int count = 0;
    ProcessSerialNumber process;
    while (GetNextProcess(&process) == noErr) {
        const std::string name = nameOfProcess(process);
        if (name.empty()) {
            continue;
        }
        if (wanted.empty()) {
            count += siblingsOfName(name);
        } else if (name == wantedBytes) {
            if (kill) {
                KillProcess(&process);
            }
            return 1;
        }
    }
    return count;
}

bool canBeExecuted(const std::string& path) {
    struct stat status;
    return stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode) &&
           access(path.c_str(), X_OK) == 0;
}

// wxExecute installs a SIGCHLD handler that would interrupt waits, and would use destroyed objects
// while the program ends. This restores the previous handler.
class ChildSignalKept {
  public:
    ChildSignalKept() { sigaction(SIGCHLD, nullptr, &m_before); }
    ~ChildSignalKept() { sigaction(SIGCHLD, &m_before, nullptr); }
    ChildSignalKept(const ChildSignalKept&) = delete;
    ChildSignalKept& operator=(const ChildSignalKept&) = delete;

  private:
    struct sigaction m_before;
};

// Children started during its lifetime ignore SIGHUP. The viewer outlives the tool, and may get the
// signal before it can ignore it itself.
class HangUpIgnored {
  public:
    HangUpIgnored() {
        struct sigaction ignored = {};
        ignored.sa_handler = SIG_IGN;
        sigaction(SIGHUP, &ignored, &m_before);
    }
    ~HangUpIgnored() { sigaction(SIGHUP, &m_before, nullptr); }
    HangUpIgnored(const HangUpIgnored&) = delete;
    HangUpIgnored& operator=(const HangUpIgnored&) = delete;

  private:
    struct sigaction m_before;
};

// Quotes one word of a command line that interprets backslashes and quotes.
wxString quoted(const wxString& word) {
    wxString escaped = word;
    escaped.Replace("\\", "\\\\");
    escaped.Replace("\"", "\\\"");
    return "\"" + escaped + "\"";
}

// Returns the exit code of the ended program or the id of the started one. Returns -1 or 0 if there
// is no executable file, which a started child would report only on standard error.
long execute(const wxString& program, const wxString& arguments, bool wait) {
    if (!canBeExecuted(bytesFromText(program))) {
        return wait ? -1 : 0;
    }
    const wxArrayString words =
        wxCmdLineParser::ConvertStringToArgs(quoted(program) + arguments, wxCMD_LINE_SPLIT_UNIX);
    std::vector<std::string> bytes;
    bytes.reserve(words.size());
    for (const wxString& word : words) {
        bytes.push_back(bytesFromText(word));
    }
    std::vector<const char*> pointers;
    pointers.reserve(bytes.size() + 1);
    for (const std::string& word : bytes) {
        pointers.push_back(word.c_str());
    }
    pointers.push_back(nullptr);
    const ChildSignalKept kept;
    return wxExecute(pointers.data(), wait ? wxEXEC_SYNC : wxEXEC_ASYNC);
}

} // namespace

wxString Helper::GetAttributeValueFromPlist(const wxString& path, const wxString& key) {
    wxFileName name(path);
    name.Normalize(wxPATH_NORM_TILDE);
    if (!name.Exists(wxFILE_EXISTS_ANY)) {
        return {};
    }
    const wxString command =
        plistCommandWord() + " -c \"Print :" + key + "\" \"" + name.GetFullPath() + "\"";
    return wxString::FromUTF8(firstLineOf(bytesFromText(command)).c_str()).Trim();
}

wxString Helper::GetHWBInstallationPath() {
    for (const char* key :
         {"'Nerova Hue Workbench':library_path", "'Nerova Hue Workbench':installed_path"}) {
        const wxString path = GetAttributeValueFromPlist(underRoot(suitePlist), key);
        if (isFolder(path)) {
            return path;
        }
    }
    const wxString family = underRoot(familyFolder);
    if (holds(family, "/Nerova Hue Workbench.app")) {
        return family;
    }
    const wxString workbench = underRoot("/Applications/Nerova/Hue Workbench 4");
    return holds(workbench, measureBundle) ? workbench : wxString();
}

wxString Helper::GetNerovaMeasurePath(bool withExecutable) {
    const auto folder = []() -> wxString {
        for (const char* plist : measurePlists) {
            const wxString path = GetAttributeValueFromPlist(underRoot(plist), "installed_path");
            if (isFolder(path)) {
                return path;
            }
        }
        for (const char* literal : {familyFolder, "/Applications/Nerova/NerovaMeasure"}) {
            const wxString path = underRoot(literal);
            if (holds(path, measureBundle)) {
                return path;
            }
        }
        return {};
    }();
    if (!withExecutable || folder.empty()) {
        return folder;
    }
    return folder + "/NerovaMeasure.app/Contents/MacOS/NerovaMeasure";
}

bool Helper::CheckFileValidity(const wxString& path) {
    return !path.empty() && wxFileName::Exists(path, wxFILE_EXISTS_ANY);
}

bool Helper::LaunchNerovaMeasure(const NerovaMeasureParams& params, int& exitCode, bool) {
    if (IsNMRunning()) {
        exitCode = 1015;
        return false;
    }
    const wxFileName name(GetNerovaMeasurePath(true));
    if (!isFolder(name.GetPath())) {
        return false;
    }
    const wxString tool = name.GetFullPath();
    const wxString options = wxFileName::CreateTempFileName("NerovaMeasure");
    std::ofstream(bytesFromText(options), std::ios::binary) << measure::optionsText(params);
    if (!CheckFileValidity(tool) || !CheckFileValidity(options)) {
        exitCode = 1000;
        return false;
    }
    execute(tool, " " + quoted(options), false);
    std::this_thread::sleep_for(std::chrono::seconds(2));
    while (IsNMRunning()) {
        std::this_thread::sleep_for(std::chrono::seconds(1));
    }
    exitCode = 0; // The tool's own exit code is unknown (C62).
    return true;
}

bool Helper::IsNMRunning() {
    return IsHWBAppsRunning("NerovaMeasure", false);
}

bool Helper::IsHWBAppsRunning(const wxString& processName, bool kill) {
    bool found = false;
    for (int passes = 3; countApplications(processName, kill) > 0;) {
        found = true;
        if (--passes == 0) {
            break;
        }
        std::this_thread::sleep_for(std::chrono::seconds(1));
    }
    return found;
}

bool Helper::IsNerovaVerifyRunning(bool) {
    return IsHWBAppsRunning("Nerova Verify", true);
}

bool Helper::LaunchNerovaVerify(int& exitCode, bool wait, const wxString& arguments, bool unused) {
    exitCode = 0;
    IsNerovaVerifyRunning(unused);
    std::error_code ignored;
    const std::filesystem::path workingFolder = std::filesystem::current_path(ignored);
    std::filesystem::current_path(platform::underRoot(familyFolder), ignored);
    const wxFileName viewer = GetNerovaVerifyPath();
    if (!viewer.Exists(wxFILE_EXISTS_ANY)) {
        exitCode = -1;
        return false;
    }
    const wxString path = viewer.GetFullPath();
    const HangUpIgnored hangUp;
    long code = CheckFileValidity(path) ? execute(path, arguments, wait) : -1;
    if (code == 255) {
        code = -1;
    }
    std::filesystem::current_path(workingFolder, ignored);
    return wait ? code != -1 && code < 1000 : code != 0;
}

wxFileName Helper::GetNerovaVerifyPath() {
    const wxFileName application(
        underRoot("/Applications/Nerova/Nerova Verify.app/Contents/MacOS/nwjs"));
    if (application.Exists(wxFILE_EXISTS_ANY)) {
        return application;
    }
    return wxFileName(
        underRoot("/Applications/Nerova/Nerova Verify.app/Contents/MacOS/Nerova Verify"));
}
