// SPDX-License-Identifier: Apache-2.0
// What the measuring tool is told to do.
#pragma once

#include <wx/string.h>

/// The measuring tool's options, each as text, numbers and truth values too. An empty field means
/// that the option is not given.
///
/// The order is that in which the options are written. Each field's option is its own name behind a
/// hyphen, but for `unassigned`, which has none (C61).
struct NerovaMeasureParams {
    wxString apnm; ///< Name of the calling application.
    wxString l;    ///< Language, as a decimal number.
    wxString s;
    wxString user;
    wxString pwd; ///< Always written, in double quotes, even when empty.
    wxString i;   ///< Name of the instrument.
    wxString j;
    wxString m; ///< What to do.
    wxString chart;
    wxString chartwidth;
    wxString chartheight;
    wxString paper;
    wxString width;
    wxString height;
    wxString o;         ///< Where the measured samples go.
    wxString patch;     ///< Path of the definition file.
    wxString patchname; ///< Name shown for it.
    wxString testmode;
    wxString ncolorref;
    wxString optdevlink;
    wxString opJPFile;
    wxString showjpuialltimes;
    wxString nomeasureshowdata;
    wxString measit8;
    wxString createchart4meas;
    wxString forcemeasure;
    wxString previewjpgfile;
    wxString previewheightratio;
    wxString chartsonly;
    wxString chartspath;
    wxString completepagesize;
    wxString nosettingspage;
    wxString iterationcount;
    wxString path2copyinputit8;
    wxString givebackpatchinfo;
    wxString lcanonic;
    wxString isnerovakzserver;
    wxString kzlogintype;
    wxString eplpath;
    wxString automatic;
    wxString wfid;
    wxString jobname;
    wxString visualchart;
    wxString taglinefile;
    wxString showpdfwfpatch;
    wxString unassigned; ///< No option reads it.
    wxString showOnly918patch;
    wxString warmupcopiescount;
    wxString add2it8;
    wxString disablechartsize;
    wxString measuresetcount;
    wxString showils;
    wxString knownpatch;
    wxString appmetajson;
    wxString showalphaindicators;
    wxString ismeasdeviceils;
    wxString mediapresetname;
    wxString outputdevicename;
    wxString iteration;
    wxString outputprofile;
    wxString colorspace;
    wxString outputprofileid;
    wxString dontshowtc1617chart;
    wxString xorigin;
    wxString yorigin;
    wxString forceWhiteFlood;
};
