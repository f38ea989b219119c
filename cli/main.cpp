// Entry point. There is no option parser: the number of arguments alone decides what is done, and
// each argument is read by its position. All that is printed goes to standard output, and a failure
// shows as the exit code only: the callers rely on both.

#include <algorithm>
#include <clocale>
#include <cstddef>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <functional>
#include <numeric>
#include <ostream>
#include <string>
#include <string_view>

#include <langinfo.h>
#include <malloc.h>

#include <wx/debug.h>
#include <wx/log.h>
#include <wx/string.h>

#include "ExitCodes.h"
#include "cli/CLogger.h"
#include "cli/HelpText.h"
#include "job/AnalysisLibrary.h"
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

/// Through wxString in pieces, since the narrow copy of a large result would cost as much memory as
/// the analysis itself. A piece of plain ASCII, as all of ours are, is narrowed here: wx goes
/// through the C library's converter twice, which took a seventh of a whole run.
void writeText(std::ostream& stream, std::wstring_view text) {
    constexpr std::size_t pieceLength = 1 << 14;
    std::string narrow;
    for (; !text.empty() && stream; text.remove_prefix(std::min(pieceLength, text.size()))) {
        const std::wstring_view piece = text.substr(0, pieceLength);
        const bool ascii =
            (std::reduce(piece.begin(), piece.end(), wchar_t{}, std::bit_or<>()) & ~0x7F) == 0;
        if (ascii) {
            narrow.assign(piece.begin(), piece.end());
            stream << narrow;
        } else {
            stream << wxString(piece.data(), piece.size());
        }
    }
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

    std::ofstream output(arguments[4], std::ios::out | std::ios::trunc);
    if (!output) {
        return exitResultNotWritten;
    }
    writeText(output, json);
    output.close();
    return output ? exitDone : exitResultNotWritten;
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
        return exitJobFormRefused;
    default:
        std::puts("To see usage please use argument -help");
        return exitWrongArguments;
    }
}
