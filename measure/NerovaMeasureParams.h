// SPDX-License-Identifier: Apache-2.0
// The options of the measuring tool.
#pragma once

#include <wx/string.h>

/// All options are texts, including numbers and truth values. An empty field means that the option
/// is not given.
///
/// The order is that of the options file. Each option's name is a hyphen plus the field's name,
/// except for `unassigned`, which has no option (C61).
struct NerovaMeasureParams {
    wxString apnm; ///< Name of the calling application.
    wxString l;    ///< Language, as a decimal number.
    wxString s;
    wxString user;
    wxString pwd; ///< Always written, in double quotes, even if empty.
    wxString i;   ///< Name of the instrument.
    wxString j;
    wxString m; ///< The action.
    wxString chart;
    wxString chartwidth;
    wxString chartheight;
    wxString paper;
    wxString width;
    wxString height;
    wxString o;         ///< File for the measured samples.
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
    wxString unassigned; ///< No option uses it.
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
