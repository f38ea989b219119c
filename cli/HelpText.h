// SPDX-License-Identifier: Apache-2.0
// The output of "-help". Callers rely on every byte, including its spelling (C1).
#pragma once

inline constexpr char helpText[] =
    R"(Command line arguments

To see this help: -help
To see Tintgate.exe version: -version
To see libTintgateLib.dylib version: -versiond

**************************************************************************************
For whole summary calculation:
Tintgate.exe [ <target> <measurement> <tolerance> <output> [patch set]]
Where:
<target> : path and name of an input icc profile or it8 file containing reference values
<measurement> : path and name of an input icc profile or it8 file containing mesurement values
<tolerance> : path and name of an input XML file containing tolerance values
<output> : path and name of an output json file containing calculated resulting values
[patch set] : OPTIONAL, can be left empty, path and name of an input it8 file containing CMYK reference values
PLEASE NOTE! if you defined patch set file then the read CMYK reference values will be used for all calculations,
otherwise if you define one of the inputs as icc profile then at least target or measurement have to contain reference CMYK values
**************************************************************************************

**************************************************************************************
For input file validation:
Tintgate.exe [ <file> ]
Where:
<file> : path and name of an input it8 or icc file for validation
**************************************************************************************

**************************************************************************************
)"
    // Keep the blank at the end of this line (C1).
    "For L*ab calculation from reference CMYK values and an icc profile: \n"
    R"(Tintgate.exe [ <reference> <profile> <output> ]
Where:
<reference> : path and name of an input it8 file containing reference CMYK values
<profile> : path and name of an icc profile
<output> : path and name of an output it8 file containing calculated L*ab values
**************************************************************************************

)";
