// Entry point. There is no option parser: the number of arguments alone decides what is done, and
// each argument is read by its position. All that is printed goes to standard output, and a failure
// shows as the exit code only: the callers rely on both.

#include <clocale>
#include <cstdio>
#include <cstring>
#include <string>

#include <langinfo.h>
#include <malloc.h>

#include <wx/debug.h>
#include <wx/init.h>
#include <wx/log.h>

#include "ExitCodes.h"
#include "cli/CLogger.h"
#include "cli/HelpText.h"
#include "job/AnalysisLibrary.h"
#include "job/JobFiles.h"
#include "job/KZVerifyJobProcessor.h"
#include "platform/TemporaryFolder.h"

namespace {

/// The tool's own version; that of the library is a matter of its own.
constexpr int toolVersion[] = {1, 6, 20};

/// Texts and file names are taken as the user's locale has them, and as UTF-8 where that can't hold
/// every character. Numbers keep their point. wx is to stay silent whatever happens.
void prepareProcess() {
    const char* locale = std::setlocale(LC_CTYPE, "");
    if (locale == nullptr || std::strcmp(nl_langinfo(CODESET), "UTF-8") != 0) {
        std::setlocale(LC_CTYPE, "C.UTF-8");
    }
    wxDisableAsserts();
    wxLog::EnableLogging(false);
}

/// A run lives for milliseconds and allocates in ever larger pieces. To map each of them and to
/// give each back would cost a sixteenth of a run with a usual chart.
void keepFreedMemory() {
    constexpr int piece = 32 << 20; // The largest that the C library accepts for M_MMAP_THRESHOLD.
    mallopt(M_MMAP_THRESHOLD, piece);
    mallopt(M_TRIM_THRESHOLD, piece);
    mallopt(M_TOP_PAD, piece / 4);
}

/// Leaves the arguments of this run, a job's password among them, in a log of its own.
void logArguments(int count, char* arguments[]) {
    const std::string folder = platform::temporaryFolder();
    if (folder.empty()) {
        return;
    }
    CLogger::InitLogger(folder + "/Tintgate.log");
    for (int i = 0; i < count; ++i) {
        CLogger::GetLogger()->Log("argument %d: %s", i, arguments[i]);
    }
    CLogger::DeleteLogger();
}

int answerWord(const std::string& word) {
    if (word == "-help") {
        std::fputs(helpText, stdout);
        return exitDone;
    }
    if (word == "-version") {
        std::printf("%d.%d.%d\n", toolVersion[0], toolVersion[1], toolVersion[2]);
        return exitDone;
    }
    if (word == "-versiond") {
        unsigned int major = 0;
        unsigned int minor = 0;
        unsigned int patch = 0;
        getLibVersion(major, minor, patch);
        std::printf("%u.%u.%u\n", major, minor, patch);
        return exitDone;
    }
    return validateInputFile(stringToWstring(word));
}

/// The output is opened in place, so that links and /dev/stdout work, and not before there is
/// something to write: a failed comparison leaves an existing file as it was.
int calculateSummary(char* arguments[], const char* patchSetPath) {
    const std::wstring target = stringToWstring(arguments[1]);
    const std::wstring measurement = stringToWstring(arguments[2]);
    const std::wstring tolerancePath = stringToWstring(arguments[3]);
    const std::wstring patchSet = stringToWstring(patchSetPath);

    tolerancePresetParameterRecord tolerance;
    int result = parsePresetParameterXMLFile(tolerancePath, &tolerance, false);
    if (result != exitDone) {
        return result;
    }
    std::wstring json;
    result = analyzeMeasurements(target, measurement, patchSet, tolerance, nullptr, &json, nullptr);
    if (result != exitDone) {
        return result;
    }

    return writeTextFile(arguments[4], json) ? exitDone : exitResultNotWritten;
}

/// What stands behind the last ":" of an argument, or all of it.
std::wstring valueOf(const char* argument) {
    const std::wstring text = stringToWstring(argument);
    return text.substr(text.rfind(L':') + 1); // Without a ":", from the start.
}

/// A client application starts one run for each job, and looks at nothing but its exit code. An
/// exception is not caught: a job id that is no number ends the process by one.
int verifyJob(int count, char* arguments[]) {
    if (std::strstr(arguments[1], "KEY_KZ_HOST") == nullptr) {
        return exitJobFormRefused;
    }
    const bool remeasure = count == 9 && std::strcmp(arguments[8], "KEY_KZ_REMEASURE:=:true") == 0;
    const wxInitializer wx; // The file forms do without, which saves a part of their time.
    KZVerifyJobProcessor processor;
    unsigned int major = 0;
    unsigned int minor = 0;
    unsigned int patch = 0;
    getLibVersion(major, minor, patch);
    CLogger::GetLogger()->Log("Tintgate.exe verion = %d.%d.%d", toolVersion[0], toolVersion[1],
                              toolVersion[2]);
    CLogger::GetLogger()->Log("TintgateLib.dll verion = %u.%u.%u", major, minor, patch);
    return processor.VerifyKZJob(valueOf(arguments[1]), valueOf(arguments[7]),
                                 valueOf(arguments[6]), valueOf(arguments[3]),
                                 valueOf(arguments[2]), valueOf(arguments[4]), remeasure);
}

} // namespace

int main(int argc, char* argv[]) {
    keepFreedMemory();
    prepareProcess();
    logArguments(argc, argv);

    switch (argc) {
    case 2:
        return answerWord(argv[1]);
    case 3:
        return exitDone; // Required: two arguments are no form and no mistake either.
    case 4:
        return writeLabFromReferencesAndICCProfile(
            stringToWstring(argv[1]), stringToWstring(argv[2]), stringToWstring(argv[3]));
    case 5:
        return calculateSummary(argv, "");
    case 6:
        return calculateSummary(argv, argv[5]);
    case 8:
    case 9:
        return verifyJob(argc, argv);
    default:
        std::puts("To see usage please use argument -help");
        return exitWrongArguments;
    }
}
