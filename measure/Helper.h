// SPDX-License-Identifier: Apache-2.0
// The companion applications around the tool: the measuring tool "NerovaMeasure", the viewer
// "Nerova Verify" and the Hue Workbench suite, in whose folder the comm plug-in lives.
#pragma once

#include <wx/filename.h>
#include <wx/string.h>

struct NerovaMeasureParams;

/// Each call looks afresh at the machine, below the system root (platform/SystemRoot.h).
class Helper {
  public:
    /// The value of a key such as "installed_path" or "'Nerova Hue Workbench':library_path" in a
    /// property list; empty if there is no such file or value. Of the value, the first line counts,
    /// and of that 255 bytes, without blanks at its end.
    static wxString GetAttributeValueFromPlist(const wxString& path, const wxString& key);

    /// Folder of the suite, or empty.
    static wxString GetHWBInstallationPath();

    /// Folder of the measuring tool or, withExecutable, the tool itself; empty if not installed.
    static wxString GetNerovaMeasurePath(bool withExecutable);

    /// True if anything exists at the path.
    static bool CheckFileValidity(const wxString& path);

    /// Runs the measuring tool with these options, and waits until it has gone away, two seconds at
    /// least. A tool that takes longer to show up is not waited for (C63).
    ///
    /// True once it was started, with exitCode 0 whatever became of it: only its files tell. False
    /// with 1015 if the tool was running already, with 1000 if there is no such tool or no place
    /// for the options, and with exitCode left alone if not even its folder exists (C64). The
    /// options file stays in the temporary folder. The last argument is not used (C119).
    static bool LaunchNerovaMeasure(const NerovaMeasureParams& params, int& exitCode, bool);

    /// Whether the measuring tool runs. Takes about 2 seconds while it does.
    static bool IsNMRunning();

    /// Whether an application of this name was seen running; with kill, it is asked to end.
    ///
    /// It looks up to three times, a second apart, and stops when there is nothing to see (C67).
    /// With an empty name it looks for the applications of the suite, and ends none.
    static bool IsHWBAppsRunning(const wxString& processName, bool kill);

    /// Whether the viewer was running. It ends a viewer that is, whatever the argument says, so
    /// that the viewer to be started takes its place (C66).
    static bool IsNerovaVerifyRunning(bool);

    /// Starts the viewer, in place of one that runs. The arguments go behind its path as they are:
    /// they start with a blank, are split at blanks, and quotes and backslashes in them are eaten.
    ///
    /// Without wait, true if it was started; with wait, true if it ended with a code below 255.
    /// exitCode becomes 0, or -1 if there is no viewer, in which case the working folder stays that
    /// of the applications (C70). The last argument is not used.
    static bool LaunchNerovaVerify(int& exitCode, bool wait, const wxString& arguments, bool);

    /// The viewer's executable: of its two forms the first that exists, else the second.
    static wxFileName GetNerovaVerifyPath();
};
