// SPDX-License-Identifier: Apache-2.0
// Entry point. There is no option parser: the number of arguments selects the operation, and each
// argument is read by position. All output goes to standard output, and failures are visible only
// as the exit code. Callers rely on both (C2).

#include <clocale>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <string>
#include <system_error>

#include <langinfo.h>
#include <malloc.h>

#include "ExitCodes.h"
#include "base/SharedObject.h"
#include "base/TextFile.h"
#include "cli/CLogger.h"
#include "cli/HelpText.h"
#include "cli/JobForm.h"
#include "job/AnalysisLibrary.h"
#include "platform/TemporaryFolder.h"

namespace {

using cli::toolVersion;

/// Texts and file names use the user's locale, or UTF-8 if that locale can't represent every
/// character. Numbers keep the decimal point.
void prepareProcess() {
    const char* locale = std::setlocale(LC_CTYPE, "");
    if (locale == nullptr || std::strcmp(nl_langinfo(CODESET), "UTF-8") != 0) {
        std::setlocale(LC_CTYPE, "C.UTF-8");
    }
}

/// A run lasts milliseconds and allocates ever larger blocks. Mapping and unmapping each of them
/// would cost a sixteenth of a run with a typical chart.
void keepFreedMemory() {
    constexpr int piece = 32 << 20; // The C library's maximum for M_MMAP_THRESHOLD.
    mallopt(M_MMAP_THRESHOLD, piece);
    mallopt(M_TRIM_THRESHOLD, piece);
    mallopt(M_TOP_PAD, piece / 4);
}

/// Writes the arguments of this run, including a job's password, to a log of their own (C5).
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
    return validateInputFile(stringToWstring(word)); // Any other word is a path (C4).
}

/// The output is opened in place, so that links and /dev/stdout work. It is opened only when there
/// is something to write: a failed comparison leaves an existing file unchanged.
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

    return base::writeTextInPlace(arguments[4], json) ? exitDone : exitResultNotWritten;
}

/// Null if the module is not at its installed place relative to the program.
cli::VerifyJob loadJobForm() {
    std::error_code failure;
    const auto program = std::filesystem::read_symlink("/proc/self/exe", failure);
    for (const char* const folder : {"../lib", TINTGATE_LIBRARIES_FROM_PROGRAMS}) {
        const base::SharedObject module(
            (program.parent_path() / folder / "tintgate/TintgateJob.so").c_str());
        cli::VerifyJob verify = nullptr;
        if (!failure && module.find(cli::verifyJobName, verify)) {
            return verify;
        }
    }
    return nullptr;
}

/// A client application starts one run per job and reads only its exit code (C9). Exceptions are
/// not caught: a job id that is not a number terminates the process (C8).
int verifyJob(int count, char* arguments[]) {
    if (std::strstr(arguments[1], "KEY_KZ_HOST") == nullptr) {
        return exitJobFormRefused;
    }
    const cli::VerifyJob verify = loadJobForm();
    return verify == nullptr ? static_cast<int>(exitJobFormRefused) : verify(count, arguments);
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
        return exitDone; // Two arguments are neither a form nor an error (C3).
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
