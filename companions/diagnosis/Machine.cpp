// SPDX-License-Identifier: Apache-2.0
#include "companions/diagnosis/Machine.h"

#include <filesystem>

#include <sys/stat.h>
#include <unistd.h>

#include "ExitCodes.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "base/WideBytes.h"
#include "companions/diagnosis/Words.h"
#include "measure/Helper.h"

namespace diagnosis {

std::vector<Finding> judgeMachine(const std::string& temporaryFolder, bool measures) {
    std::vector<Finding> findings;
    const auto tell = [&](std::string where, std::string text, std::vector<int> codes) {
        findings.push_back({std::move(where), std::move(text), std::move(codes)});
    };
    const std::string bundle = base::bytesFromWide(ComGUIManager::PlugInPath());
    if (!std::filesystem::is_directory(bundle)) {
        tell(bundle, "is missing. Without the comm plug-in no login succeeds.",
             {exitLoginNoServer});
    }
    const std::string tool = measures ? bytesOf(Helper::GetNerovaMeasurePath(true)) : std::string();
    if (measures && access(tool.c_str(), X_OK) != 0) {
        tell(tool.empty() ? "measuring tool" : tool,
             "is missing or can't be executed. The job can't be measured.",
             {exitMeasuringFailed, exitSampleMissing});
    } else if (measures && Helper::IsNMRunning()) {
        tell(tool, "is running. Another measurement can't start until it ends.",
             {exitMeasuringFailed});
    }
    const std::string viewer = bytesOf(Helper::GetNerovaVerifyPath().GetFullPath());
    if (access(viewer.c_str(), X_OK) != 0) {
        tell(viewer, "is missing or can't be executed. The result is written but not shown.",
             {exitViewerNotStarted});
    }
    const std::string& folder = temporaryFolder;
    if (folder.find_first_of("\"'\\") != std::string::npos ||
        folder.find("  ") != std::string::npos) {
        tell(folder,
             "contains a quote, a backslash or two consecutive blanks: the viewer gets a wrong "
             "path and shows no page.",
             {});
    }
    struct stat status;
    const std::string working = folder + "/Tintgate";
    if (folder.empty() || (lstat(working.c_str(), &status) == 0 &&
                           (!S_ISDIR(status.st_mode) || status.st_uid != geteuid()))) {
        tell(folder.empty() ? "/tmp" : working,
             "is not a folder of this user. Runs can't store files.", {exitJdfMissing});
    }
    return findings;
}

} // namespace diagnosis
