// SPDX-License-Identifier: Apache-2.0
#include "job/StripSources.h"

#include <string>

#include <wx/filename.h>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "cli/CLogger.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/ServerPaths.h"
#include "measure/Paths.h"

using namespace jobkeys;

namespace {

// Time limits for downloads in milliseconds.
constexpr int usualWait = 1000;
constexpr int definitionWait = 200;
constexpr int dynstripWait = 500;
constexpr int profileWait = 5000;

/// The path in wxFileName's notation, with double slashes reduced. Does not access the file.
wxString normalised(const wxString& path) {
    return wxFileName(path).GetFullPath();
}

wxString inControlCharts(const JobLoad& load, const wxString& name) {
    return wxString::FromUTF8(
        controlStripPath(load.installFolder.utf8_string(), name.utf8_string()));
}

bool isDynamic(const JobLoad& load) {
    return isDynamic(load.strip, load.job->useDynstrip);
}

/// Downloads the server's definition of a dynamic strip, which is next to the strip, under the name
/// that our own definition would have. It is optional (C34).
void fetchDynamicDefinition(const JobLoad& load, wxString stripServerPath) {
    stripServerPath.Replace(".it8", ".dcf");
    load.processor->m_connector->DownloadFile(load.job->tempDir + "/NMPatchSetDefinition.dcf",
                                              stripServerPath, definitionWait);
}

int lookUpDynamicStrip(const JobLoad& load) {
    wxString path;
    int code = load.ticket.read("Footer/Dynstrip/DeviceID", 0, &load.job->deviceID);
    if (code == 0) {
        code = load.ticket.read(dynamicStripKey, &path);
    }
    if (code != 0) {
        return code;
    }
    path = normalised(path);
    if (fetchFile(load, path, usualWait, &load.job->controlStripFile)) {
        fetchDynamicDefinition(load, path);
    }
    code = load.ticket.read("Footer/Dynstrip/File", &path);
    if (code == 0) {
        fetchFile(load, path, dynstripWait, &load.job->dynstripFile);
    }
    return code;
}

int lookUpFixedStrip(const JobLoad& load) {
    int code = 0;
    const std::string name = fixedStripName(load.strip, load.ticket.texts(&code));
    KZJobDataStruct& job = *load.job;
    if (code == 0 && fetchControlStrip(load, wxString::FromUTF8(name), &job.controlStripFile)) {
        load.processor->GetDeviceIDFromIt8ControlStripFileEx(job.controlStripFile, &job.deviceID);
    }
    return code;
}

/// A packaging job: characterization data, or else the values of its strip. Only the last read
/// determines the result: if it finds a strip, missing references are not a failure (C35).
int lookUpEskoReferences(const JobLoad& load) {
    wxString path;
    if (load.ticket.read(characterisationKey, &path) != 0) {
        wxString name;
        if (load.ticket.read(stripFileKey, &name) == 0) {
            path = inControlCharts(load, name);
        }
    }
    if (!path.empty()) {
        fetchFile(load, path, usualWait, &load.job->referenceFile);
    }
    std::string strip; // As in lookUpProfile, any bytes are a path.
    if (load.ticket.read("Footer/ControlstripIT8", &strip) != 0 || strip.empty()) {
        return NoReference;
    }
    fetchFile(load, wxString::FromUTF8(strip), usualWait, &load.job->controlStripFile);
    return 0;
}

/// A path that is not UTF-8 leads nowhere but still counts: no other profile may replace it.
int lookUpProfile(const JobLoad& load) {
    if (load.job->measurementStatus > 0) {
        load.job->jobType = 3;
    }
    int ignored = 0;
    const std::string path = referenceProfile(load.strip, load.ticket.texts(&ignored));
    if (path.empty()) {
        return NoReference;
    }
    fetchFile(load, wxString::FromUTF8(path), profileWait, &load.job->referenceFile);
    return 0;
}

/// Uses the values of the strip itself.
int takeStripAsReference(const JobLoad& load) {
    load.job->referenceFile = load.job->controlStripFile;
    return 0;
}

int lookUpCharacterisation(const JobLoad& load) {
    std::string value;
    load.ticket.read(stripKey(load.strip, characterisationKey), &value);
    if (value.empty()) {
        return NoReference;
    }
    // From here on, a value that is not valid UTF-8 is empty.
    const std::string text = wxString::FromUTF8(value).utf8_string();
    const wxString path =
        wxString::FromUTF8(characterisationPath(load.installFolder.utf8_string(), text));
    fetchFile(load, isWholePath(text) ? normalised(path) : path, usualWait,
              &load.job->referenceFile);
    return 0;
}

int takeStoredReferences(const JobLoad& load) {
    KZJobDataStruct& job = *load.job;
    job.jobType = job.measurementStatus > 1 ? 3 : 2;
    job.referenceFile = job.tempDir + "/Measured reference.txt";
    const int code = load.processor->LoadKZJobReferences(&job);
    CLogger::GetLogger()->Log("LoadKZJobReferences returns = %d", code);
    if (code != 0) {
        return ReferencesNotLoaded;
    }
    if (load.processor->WriteTemporarySampleFile(job, true) != 0 ||
        !measure::fileExists(job.referenceFile)) {
        // The log line names the wrong file (C36).
        CLogger::GetLogger()->Log("Temporary Reference file not found = %s",
                                  measure::pathBytes(job.sampleFile).c_str());
        return NoReference;
    }
    return 0;
}

} // namespace

bool fetchFile(const JobLoad& load, const wxString& serverPath, int limit, wxString* localFile) {
    const wxString local = load.job->tempDir + "/" + wxFileName(serverPath).GetFullName();
    const bool came = load.processor->m_connector->DownloadFile(local, serverPath, limit);
    if (came) {
        *localFile = local;
    }
    return came;
}

bool fetchControlStrip(const JobLoad& load, const wxString& name, wxString* localFile) {
    return fetchFile(load, inControlCharts(load, name), usualWait, localFile);
}

int lookUpControlStrip(const JobLoad& load) {
    return isDynamic(load) ? lookUpDynamicStrip(load) : lookUpFixedStrip(load);
}

int lookUpReferences(const JobLoad& load) {
    switch (referenceWay(load.fromEsko == 1, load.job->measurementWorkflow, isDynamic(load),
                         load.hasStoredReferences)) {
    case ReferenceWay::Packaging:
        return lookUpEskoReferences(load);
    case ReferenceWay::Profile:
        return lookUpProfile(load);
    case ReferenceWay::DynamicStrip:
        return takeStripAsReference(load);
    case ReferenceWay::Characterisation:
        return lookUpCharacterisation(load);
    case ReferenceWay::Stored:
        return takeStoredReferences(load);
    case ReferenceWay::None:
        break;
    }
    return NoReference;
}
