// SPDX-License-Identifier: Apache-2.0
#include "cli/JobForm.h"

#include <cstring>
#include <string>

#include <wx/debug.h>
#include <wx/init.h>
#include <wx/log.h>

#include "ExitCodes.h"
#include "cli/CLogger.h"
#include "job/AnalysisLibrary.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

/// The text after the last ":" of an argument, or the whole argument if there is none (C6).
std::wstring valueOf(const char* argument) {
    const std::wstring text = stringToWstring(argument);
    return text.substr(text.rfind(L':') + 1); // Without a ":", starts at 0.
}

} // namespace

extern "C" __attribute__((visibility("default"))) int tintgateVerifyJob(int count,
                                                                        char* arguments[]) {
    // Any other text means false (C7).
    const bool remeasure = count == 9 && std::strcmp(arguments[8], "KEY_KZ_REMEASURE:=:true") == 0;
    wxDisableAsserts();
    wxLog::EnableLogging(false); // wx would report failed opens on standard error.
    const wxInitializer wx;
    KZVerifyJobProcessor processor;
    unsigned int major = 0;
    unsigned int minor = 0;
    unsigned int patch = 0;
    getLibVersion(major, minor, patch);
    // Every log has this spelling (C12).
    CLogger::GetLogger()->Log("Tintgate.exe verion = %d.%d.%d", cli::toolVersion[0],
                              cli::toolVersion[1], cli::toolVersion[2]);
    CLogger::GetLogger()->Log("TintgateLib.dll verion = %u.%u.%u", major, minor, patch);
    return processor.VerifyKZJob(valueOf(arguments[1]), valueOf(arguments[7]),
                                 valueOf(arguments[6]), valueOf(arguments[3]),
                                 valueOf(arguments[2]), valueOf(arguments[4]), remeasure);
}
