// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Words.h"

#include <array>

namespace check {
namespace {

struct Sentence {
    Say what;
    const char* text;
};

constexpr Sentence english[] = {
    {Say::Passed, "Passed"},
    {Say::Failed, "Failed"},
    {Say::Incomplete, "Incomplete"},
    {Say::NotDone, "Not verified"},
    {Say::Against, "Compared with {1} by \"{2}\""},
    {Say::AgainstCondition, "{1}: compared with {2} by \"{3}\""},
    {Say::Criteria, "Criteria"},
    {Say::LargestDifferences, "Largest differences, {1}"},
    {Say::Warnings, "Warnings"},
    {Say::WhatToDo, "What to do"},
    {Say::Cause, "Cause"},
    {Say::Remedy, "Remedy"},
    {Say::Note, "Note"},
    {Say::PageIn, "Page: {1}"},
    {Say::ResultIn, "Result: {1}"},
    {Say::LabelIn, "Label: {1}"},
    {Say::CertificateIn, "Certificate: {1}"},
    {Say::FactCondition, "Condition"},
    {Say::FactPrinter, "Printer"},
    {Say::FactPaper, "Paper"},
    {Say::Of, "of"},
    {Say::PatchesMeasured, "{1} patches"},
    {Say::NoSuchPatches, "no such patches"},
    {Say::MoreCriteria, "and {1} more criteria that passed"},
    {Say::Progress, "{1} of {2} verified"},
    {Say::ProgressOfUnknown, "{1} verified"},
    {Say::Total, "{1}: {2}"},
    {Say::TotalPassed, "{1} passed"},
    {Say::TotalFailed, "{1} failed"},
    {Say::TotalIncomplete, "{1} incomplete"},
    {Say::TotalNotDone, "{1} not verified"},
    {Say::OneMeasurement, "1 measurement"},
    {Say::SeveralMeasurements, "{1} measurements"},
    {Say::AlreadyVerified, "{1} already verified"},

    {Say::AdvicePassed, "Nothing: the print is within its tolerances."},
    {Say::AdvicePaper,
     "Check the paper: is it the one that the condition is meant for, and was it measured on the "
     "right backing?"},
    {Say::AdviceSolids,
     "Check the inks: nozzles or densities first, then calibrate the printer and print again."},
    {Say::AdviceGreys,
     "Calibrate the printer (linearization and grey balance), then print and measure again."},
    {Say::AdviceSinglePatches,
     "Few patches are far off while the average is good: look at these patches on the sheet for "
     "dirt or scratches, and measure again."},
    {Say::AdviceFarOff,
     "The average is far above its tolerance: check first that this print was made for {1}. "
     "Another condition is chosen with -c, another target with -t."},
    {Say::AdviceCalibrate, "Calibrate the printer, print and measure again."},
    {Say::AdviceMissingPatches,
     "The sheet has no patches for some criteria: print a strip that has them, or choose a preset "
     "that does not judge by them (-p)."},
    {Say::AdviceDoubt,
     "Settle what is marked with \"?\" above. As long as it is open, the print can't pass."},
    {Say::AdviceNothingJudged, "Choose a preset that judges by at least one criterion (-p)."},
    {Say::AdviceSwapped,
     "The measurement is {1}, which looks like reference data. Were target and measurement "
     "swapped? The target follows -t."},
    {Say::AdviceSameFile,
     "Target and measurement are one file, so this verdict proves nothing: give the export of "
     "your print as the measurement."},
    {Say::AdviceShowPage, "With --page you get all patches and charts as a page."},

    {Say::EmptyFile, "The file is empty"},
    {Say::EmptyFileRemedy, "Export the measurement again and look at the file's size"},
    {Say::IsPreset, "This is a tolerance preset, not a measurement"},
    {Say::IsPresetRemedy, "Give the preset after -p: tintgate-check -p {1} MEASUREMENT"},
    {Say::IsResult, "This is a result of a verification, not a measurement"},
    {Say::IsResultRemedy, "'tintgate-report --text {1}' shows it"},
    {Say::IsSpreadsheet, "This is a spreadsheet (or another packed file), not a measurement"},
    {Say::IsSpreadsheetRemedy,
     "Export the measurement as CGATS text or CxF3 from the measuring program, or save the sheet "
     "as tab-separated text with the columns of CGATS"},
    {Say::IsPdf, "This is a PDF, not a measurement"},
    {Say::IsPdfRemedy, "Export the measurement as CGATS text or CxF3 from the measuring program"},
    {Say::IsPicture, "This is a picture, not a measurement"},
    {Say::IsPictureRemedy, "Measure the print with an instrument, and export CGATS text or CxF3"},
    {Say::IsFolder, "This is a folder, and a file is needed here"},
    {Say::IsFolderRemedy, "Give the path of a file in it"},
    {Say::NoFile, "There is no such file"},
    {Say::NoFileRemedy, "Check the path and its spelling. A name with blanks needs quotes"},
    {Say::NoMatch, "No file has a name like {1}"},
    {Say::NoMatchRemedy,
     "Nothing in the folder fits the pattern, so the shell passed it on as it is: check the folder "
     "and the names' endings"},
    {Say::RgbMeasurement,
     "The measurement has RGB values, and the target has CMYK: no patch of the one is found in the "
     "other"},
    {Say::RgbMeasurementRemedy,
     "Measure a chart that was printed from CMYK, or export it with its CMYK values. If the chart "
     "was printed through a profile as RGB, export it with the ids of the target's chart"},
    {Say::BothProfiles,
     "Target and measurement are both profiles, so nothing says which patches to compare"},
    {Say::BothProfilesRemedy, "Give a list of CMYK patches with --patch-set"},
    {Say::NoCmyk,
     "One side is a profile, and the other has no CMYK values at which to evaluate it"},
    {Say::NoCmykRemedy,
     "Export the measurement with its CMYK values, or give a text as the target with -t"},
    {Say::OtherChart, "The measurement is of another chart than the target"},
    {Say::OtherChartRemedy,
     "Export the measurement with device values (CMYK) or with the ids of the target's patches, or "
     "choose the target of this chart with -t"},
    {Say::NotAllowedToRead, "You are not allowed to read this file"},
    {Say::NotAllowedToReadRemedy,
     "Have its permissions changed: chmod a+r FILE for the file, chmod a+x for the folders above"},
    {Say::FolderUnreadable, "A folder can't be read: {1}"},
    {Say::FolderUnreadableRemedy, "Check the folder's permissions (chmod a+rx FOLDER)"},
    {Say::FolderEmpty, "There is no measurement in this folder or below"},
    {Say::FolderEmptyRemedy,
     "In a folder, files count by their endings: {1}. Name other files one by one"},
    {Say::TargetTrouble, "The target can't be used: {1}"},
    {Say::PatchSetTrouble, "The patch set can't be used: {1}"},
    {Say::PresetTrouble, "The tolerance preset can't be used: {1}"},
    {Say::PresetFault, "Line {1}: {2}"},
    {Say::PresetFaultRemedy,
     "Correct this line. The presets that 'tintgate-check --list' shows are examples"},

    {Say::OutputIsInput, "{1} is an input of this run, and was not written"},
    {Say::OutputIsInputRemedy, "Give another folder for outputs with --out"},
    {Say::OutputNotOurs, "{1} is there already and was not made by Tintgate, so it stays"},
    {Say::OutputNotOursRemedy,
     "Move that file away, or give another folder for outputs with --out"},
    {Say::OutputTwice, "{1} is the output of another measurement of this run"},
    {Say::OutputTwiceRemedy,
     "Measurements whose names differ only in their endings or folders need different names, or "
     "one run each with its own --out"},
    {Say::LabelNotDrawn, "The label or certificate could not be drawn: {1}"},
    {Say::LabelNotDrawnRemedy, "Install a font, such as the package fonts-dejavu-core."},
    {Say::OutputNotWritten, "{1} could not be written: {2}"},
    {Say::OutputFullRemedy, "Make room on the disk, or give a folder on another one with --out"},
    {Say::OutputForbiddenRemedy,
     "Give a folder that you may write to with --out, or have the folder's permissions changed"},
    {Say::OutputNoFolderRemedy, "Check the path that follows --out"},
    {Say::OutputOtherRemedy, "Check the folder and its disk, or give another one with --out"},
    {Say::StandardOutput, "standard output"},

    {Say::ConditionsMissing, "There is no file of conditions at {1}"},
    {Say::ConditionsMissingRemedy, "Check the path that follows --conditions"},
    {Say::ConditionsBroken, "{1} can't be understood: {2}"},
    {Say::ConditionsBrokenRemedy,
     "Correct the line. Texts are in quotes, and each condition begins with a line such as "
     "[conditions.coated-proof]"},
    {Say::UnknownKey, "{1}: \"{2}\" is not known here"},
    {Say::UnknownKeyRemedy, "Known are: {1}"},
    {Say::NotText, "{1}: \"{2}\" must be a text in quotes"},
    {Say::NotTextRemedy, "Put the value in quotes: {1} = \"...\""},
    {Say::NoTarget, "{1}: the condition \"{2}\" has no target"},
    {Say::NoTargetRemedy, "Add a line such as target = \"FOGRA39L.ti3\" to it"},
    {Say::DefaultUnknown, "{1}: the default \"{2}\" is not among the conditions"},
    {Say::NoSuchCondition, "There is no condition \"{1}\""},
    {Say::ConditionIsPreset, "\"{1}\" is a preset: it follows -p, and -t names the target"},
    {Say::ConditionIsDataSet, "\"{1}\" is a data set: it follows -t"},
    {Say::DidYouMean, "Did you mean \"{1}\"?"},
    {Say::SeeList, "'tintgate-check --list' shows what there is"},
    {Say::NothingToHoldAgainst,
     "Nothing says what the measurement is to be compared with: there is no default condition"},
    {Say::NothingToHoldAgainstRemedy,
     "Name a target with -t (a file, or one of the data sets below), or a condition with -c"},
    {Say::NoSuchPreset, "There is no preset \"{1}\""},
    {Say::PresetIsCondition, "\"{1}\" is a condition: it follows -c"},
    {Say::NoSuchDataSet, "There is no file and no known data set \"{1}\""},
    {Say::NoSuchDataSetRemedy,
     "Check the spelling and the folder. Known data sets are shown by 'tintgate-check --list'; "
     "they are looked for in {1}"},
    {Say::AmbiguousDataSet, "Several data sets are called \"{1}\": {2}"},
    {Say::AmbiguousDataSetRemedy, "Give the name with its ending, or a path"},

    {Say::ListConditions, "Conditions in {1}"},
    {Say::ListNoConditions,
     "Conditions: none. They are read from {1}, otherwise from {2}; without them give a target "
     "with -t"},
    {Say::ListDefault, "(default)"},
    {Say::ListPresets, "Presets in {1}"},
    {Say::ListNoPresets, "Presets: none were found"},
    {Say::ListDataSets, "Data sets in {1}"},
    {Say::ListNoDataSets, "Data sets: none. The Debian package icc-profiles-free has some"},
    {Say::ListPatches, "{1} patches"},
    {Say::ListProfile, "profile"},
    {Say::ListLookedIn, "Looked in: {1}"},

    {Say::WatchStarts, "Watching {1}: results go to {2}"},
    {Say::WatchEnds, "Ended: {1}"},
    {Say::WatchFolderGone, "The folder {1} is not there"},
    {Say::WatchFolderGoneRemedy, "Check the path; a network share must be mounted first"},
    {Say::WatchNotPossible, "The folder {1} can't be watched: {2}"},
    {Say::WatchNotPossibleRemedy,
     "Use --poll, or raise the limit fs.inotify.max_user_watches (sysctl)"},
    {Say::WatchBusy, "Another tintgate-check watches with results in {1}"},
    {Say::WatchBusyRemedy, "Stop it, or give another folder for results with --out"},
    {Say::WatchLost, "Files arrived faster than they were noted; all folders are read anew"},

    {Say::NothingToVerify, "Name a measurement, or a folder of them"},
    {Say::WatchAndFiles, "--watch takes a folder and no further files"},
    {Say::OnlyWithWatch, "{1} goes together with --watch only"},
    {Say::QuietOrJson, "--quiet and --json exclude each other"},
    {Say::OutIsFile, "{1} is a file, and --out takes a folder"},
};

constexpr std::size_t count = static_cast<std::size_t>(Say::Count);

/// Fails to compile if a sentence is missing or stands in another place than its name.
constexpr bool isComplete() {
    std::size_t place = 0;
    for (const Sentence& sentence : english) {
        if (static_cast<std::size_t>(sentence.what) != place++) {
            return false;
        }
    }
    return place == count;
}
static_assert(isComplete());

} // namespace

std::string say(Say what, std::initializer_list<std::string_view> values) {
    const std::string_view text = english[static_cast<std::size_t>(what)].text;
    std::string sentence;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const bool isPlace = text[i] == '{' && i + 2 < text.size() && text[i + 2] == '}';
        const auto number = isPlace ? static_cast<std::size_t>(text[i + 1] - '1') : values.size();
        if (number < values.size()) {
            sentence += values.begin()[number];
            i += 2;
        } else {
            sentence += text[i];
        }
    }
    return sentence;
}

} // namespace check
