// SPDX-License-Identifier: Apache-2.0
// Every sentence that this program says to people. The sentences are in the tables of
// report/languages, below "check."; their keys are these names.
#pragma once

#include <initializer_list>
#include <string>
#include <string_view>

#include "report/languages/Texts.h"

namespace check {

enum class Say {
    // Verdicts and headings
    Passed,
    Failed,
    Incomplete,
    NotDone,
    Against,
    AgainstCondition,
    Criteria,
    LargestDifferences,
    Warnings,
    WhatToDo,
    Cause,
    Remedy,
    Note,
    PageIn,
    ResultIn,
    LabelIn,
    CertificateIn,
    FactCondition,
    FactPrinter,
    FactPaper,
    Of,
    PatchesMeasured,
    NoSuchPatches,
    MoreCriteria,
    Progress,
    ProgressOfUnknown,
    Total,
    TotalPassed,
    TotalFailed,
    TotalIncomplete,
    TotalNotDone,
    OneMeasurement,
    SeveralMeasurements,
    AlreadyVerified,

    // Advice
    AdvicePassed,
    AdvicePaper,
    AdviceSolids,
    AdviceGreys,
    AdviceSinglePatches,
    AdviceFarOff,
    AdviceCalibrate,
    AdviceMissingPatches,
    AdviceDoubt,
    AdviceNothingJudged,
    AdviceSwapped,
    AdviceSameFile,
    AdviceShowPage,

    // Problems of a file that have no exit code of their own
    EmptyFile,
    EmptyFileRemedy,
    IsPreset,
    IsPresetRemedy,
    IsResult,
    IsResultRemedy,
    IsSpreadsheet,
    IsSpreadsheetRemedy,
    IsPdf,
    IsPdfRemedy,
    IsPicture,
    IsPictureRemedy,
    IsFolder,
    IsFolderRemedy,
    NoFile,
    NoFileRemedy,
    NoMatch,
    NoMatchRemedy,
    RgbMeasurement,
    RgbMeasurementRemedy,
    BothProfiles,
    BothProfilesRemedy,
    NoCmyk,
    NoCmykRemedy,
    OtherChart,
    OtherChartRemedy,
    NotAllowedToRead,
    NotAllowedToReadRemedy,
    FolderUnreadable,
    FolderUnreadableRemedy,
    FolderEmpty,
    FolderEmptyRemedy,
    TargetTrouble,
    PatchSetTrouble,
    PresetTrouble,
    PresetFault,
    PresetFaultRemedy,

    // Outputs
    OutputIsInput,
    OutputIsInputRemedy,
    OutputNotOurs,
    OutputNotOursRemedy,
    OutputTwice,
    OutputTwiceRemedy,
    LabelNotDrawn,
    LabelNotDrawnRemedy,
    OutputNotWritten,
    OutputFullRemedy,
    OutputForbiddenRemedy,
    OutputNoFolderRemedy,
    OutputOtherRemedy,
    StandardOutput,

    // Conditions
    ConditionsMissing,
    ConditionsMissingRemedy,
    ConditionsBroken,
    ConditionsBrokenRemedy,
    UnknownKey,
    UnknownKeyRemedy,
    NotText,
    NotTextRemedy,
    NoTarget,
    NoTargetRemedy,
    DefaultUnknown,
    NoSuchCondition,
    ConditionIsPreset,
    ConditionIsDataSet,
    DidYouMean,
    SeeList,
    NothingToHoldAgainst,
    NothingToHoldAgainstRemedy,
    NoSuchPreset,
    PresetIsCondition,
    NoSuchDataSet,
    NoSuchDataSetRemedy,
    AmbiguousDataSet,
    AmbiguousDataSetRemedy,

    // Lists
    ListConditions,
    ListNoConditions,
    ListDefault,
    ListPresets,
    ListNoPresets,
    ListDataSets,
    ListNoDataSets,
    ListPatches,
    ListProfile,
    ListLookedIn,

    // Watching
    WatchStarts,
    WatchEnds,
    WatchFolderGone,
    WatchFolderGoneRemedy,
    WatchNotPossible,
    WatchNotPossibleRemedy,
    WatchBusy,
    WatchBusyRemedy,
    WatchLost,

    // Usage
    NothingToVerify,
    WatchAndFiles,
    OnlyWithWatch,
    QuietOrJson,
    OutIsFile,
    NoSuchLanguage,

    Count
};

/// Chooses the languages of this program's sentences and of what it shows of results (pages among
/// it); both are English at first. They differ for JSON, whose sentences stay English.
void useLanguages(languages::Language ofSentences, languages::Language ofResults);

/// The texts of results: criteria, verdicts, numbers.
const languages::Texts& texts();

/// A sentence that becomes part of a page.
std::string sayOnPage(Say what);

/// The sentence with {1}, {2} ... replaced by `values`.
std::string say(Say what, std::initializer_list<std::string_view> values = {});

} // namespace check
