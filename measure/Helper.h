// SPDX-License-Identifier: Apache-2.0
// The companion applications of the tool: the measuring tool "NerovaMeasure", the viewer "Nerova
// Verify", and the Hue Workbench suite, whose folder contains the comm plug-in.
#pragma once

#include <wx/filename.h>
#include <wx/string.h>

struct NerovaMeasureParams;

/// Each call checks the machine anew, below the system root (platform/SystemRoot.h).
class Helper {
  public:
    /// The value of a key such as "installed_path" or "'Nerova Hue Workbench':library_path" in a
    /// property list. Empty if there is no such file or value. Only the first 255 bytes of the
    /// first line count, without trailing blanks.
    static wxString GetAttributeValueFromPlist(const wxString& path, const wxString& key);

    /// Folder of the suite, or empty.
    static wxString GetHWBInstallationPath();

    /// Folder of the measuring tool or, withExecutable, the tool itself. Empty if not installed.
    static wxString GetNerovaMeasurePath(bool withExecutable);

    /// True if anything exists at the path.
    static bool CheckFileValidity(const wxString& path);

    /// Runs the measuring tool with these options and waits until it ends, at least two seconds. A
    /// tool that takes longer to appear is not waited for (C63).
    ///
    /// Returns true after a start, always with exitCode 0: only its files show the result. Returns
    /// false with exitCode 1015 if the tool was already running, with 1000 if there is no such tool
    /// or no place for the options, and with exitCode unchanged if its folder does not exist (C64).
    /// The options file stays in the temporary folder. The last argument is not used (C119).
    static bool LaunchNerovaMeasure(const NerovaMeasureParams& params, int& exitCode, bool);

    /// Whether the measuring tool is running. Takes about 2 seconds if it is.
    static bool IsNMRunning();

    /// Whether an application of this name was running. With kill, it is asked to terminate.
    ///
    /// Checks up to three times, a second apart, and stops when none is running (C67). With an
    /// empty name, checks for all applications of the suite and terminates none.
    static bool IsHWBAppsRunning(const wxString& processName, bool kill);

    /// Whether the viewer was running. Terminates a running viewer regardless of the argument, so
    /// that a new one can replace it (C66).
    static bool IsNerovaVerifyRunning(bool);

    /// Starts the viewer and replaces a running one. The arguments are appended to its path
    /// unchanged: they must start with a blank, are split at blanks, and lose quotes and
    /// backslashes.
    ///
    /// Without wait, returns true if it was started. With wait, returns true if it ended with a
    /// code below 255. exitCode becomes 0, or -1 without a viewer; then the applications' folder
    /// stays the working folder (C70). The last argument is not used.
    static bool LaunchNerovaVerify(int& exitCode, bool wait, const wxString& arguments, bool);

    /// The viewer's executable: the first of its two forms that exists, or else the second.
    static wxFileName GetNerovaVerifyPath();
};
