// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Words.h"

namespace check {
namespace {

struct Sentence {
    Say what;
    languages::Key key;
};

constexpr Sentence sentences[] = {
    {Say::Passed, "check.passed"},
    {Say::Failed, "check.failed"},
    {Say::Incomplete, "check.incomplete"},
    {Say::NotDone, "check.notDone"},
    {Say::Against, "check.against"},
    {Say::AgainstCondition, "check.againstCondition"},
    {Say::Criteria, "check.criteria"},
    {Say::LargestDifferences, "check.largestDifferences"},
    {Say::Warnings, "check.warnings"},
    {Say::WhatToDo, "check.whatToDo"},
    {Say::Cause, "check.cause"},
    {Say::Remedy, "check.remedy"},
    {Say::Note, "check.note"},
    {Say::PageIn, "check.pageIn"},
    {Say::ResultIn, "check.resultIn"},
    {Say::LabelIn, "check.labelIn"},
    {Say::CertificateIn, "check.certificateIn"},
    {Say::FactCondition, "check.factCondition"},
    {Say::FactPrinter, "check.factPrinter"},
    {Say::FactPaper, "check.factPaper"},
    {Say::Of, "check.of"},
    {Say::PatchesMeasured, "check.patchesMeasured"},
    {Say::NoSuchPatches, "check.noSuchPatches"},
    {Say::MoreCriteria, "check.moreCriteria"},
    {Say::Progress, "check.progress"},
    {Say::ProgressOfUnknown, "check.progressOfUnknown"},
    {Say::Total, "check.total"},
    {Say::TotalPassed, "check.totalPassed"},
    {Say::TotalFailed, "check.totalFailed"},
    {Say::TotalIncomplete, "check.totalIncomplete"},
    {Say::TotalNotDone, "check.totalNotDone"},
    {Say::OneMeasurement, "check.oneMeasurement"},
    {Say::SeveralMeasurements, "check.severalMeasurements"},
    {Say::AlreadyVerified, "check.alreadyVerified"},
    {Say::AdvicePassed, "check.advicePassed"},
    {Say::AdvicePaper, "check.advicePaper"},
    {Say::AdviceSolids, "check.adviceSolids"},
    {Say::AdviceGreys, "check.adviceGreys"},
    {Say::AdviceSinglePatches, "check.adviceSinglePatches"},
    {Say::AdviceFarOff, "check.adviceFarOff"},
    {Say::AdviceCalibrate, "check.adviceCalibrate"},
    {Say::AdviceMissingPatches, "check.adviceMissingPatches"},
    {Say::AdviceDoubt, "check.adviceDoubt"},
    {Say::AdviceNothingJudged, "check.adviceNothingJudged"},
    {Say::AdviceSwapped, "check.adviceSwapped"},
    {Say::AdviceSameFile, "check.adviceSameFile"},
    {Say::AdviceShowPage, "check.adviceShowPage"},
    {Say::EmptyFile, "check.emptyFile"},
    {Say::EmptyFileRemedy, "check.emptyFileRemedy"},
    {Say::IsPreset, "check.isPreset"},
    {Say::IsPresetRemedy, "check.isPresetRemedy"},
    {Say::IsResult, "check.isResult"},
    {Say::IsResultRemedy, "check.isResultRemedy"},
    {Say::IsSpreadsheet, "check.isSpreadsheet"},
    {Say::IsSpreadsheetRemedy, "check.isSpreadsheetRemedy"},
    {Say::IsPdf, "check.isPdf"},
    {Say::IsPdfRemedy, "check.isPdfRemedy"},
    {Say::IsPicture, "check.isPicture"},
    {Say::IsPictureRemedy, "check.isPictureRemedy"},
    {Say::IsFolder, "check.isFolder"},
    {Say::IsFolderRemedy, "check.isFolderRemedy"},
    {Say::NoFile, "check.noFile"},
    {Say::NoFileRemedy, "check.noFileRemedy"},
    {Say::NoMatch, "check.noMatch"},
    {Say::NoMatchRemedy, "check.noMatchRemedy"},
    {Say::RgbMeasurement, "check.rgbMeasurement"},
    {Say::RgbMeasurementRemedy, "check.rgbMeasurementRemedy"},
    {Say::BothProfiles, "check.bothProfiles"},
    {Say::BothProfilesRemedy, "check.bothProfilesRemedy"},
    {Say::NoCmyk, "check.noCmyk"},
    {Say::NoCmykRemedy, "check.noCmykRemedy"},
    {Say::OtherChart, "check.otherChart"},
    {Say::OtherChartRemedy, "check.otherChartRemedy"},
    {Say::NotAllowedToRead, "check.notAllowedToRead"},
    {Say::NotAllowedToReadRemedy, "check.notAllowedToReadRemedy"},
    {Say::FolderUnreadable, "check.folderUnreadable"},
    {Say::FolderUnreadableRemedy, "check.folderUnreadableRemedy"},
    {Say::FolderEmpty, "check.folderEmpty"},
    {Say::FolderEmptyRemedy, "check.folderEmptyRemedy"},
    {Say::TargetTrouble, "check.targetTrouble"},
    {Say::PatchSetTrouble, "check.patchSetTrouble"},
    {Say::PresetTrouble, "check.presetTrouble"},
    {Say::PresetFault, "check.presetFault"},
    {Say::PresetFaultRemedy, "check.presetFaultRemedy"},
    {Say::OutputIsInput, "check.outputIsInput"},
    {Say::OutputIsInputRemedy, "check.outputIsInputRemedy"},
    {Say::OutputNotOurs, "check.outputNotOurs"},
    {Say::OutputNotOursRemedy, "check.outputNotOursRemedy"},
    {Say::OutputTwice, "check.outputTwice"},
    {Say::OutputTwiceRemedy, "check.outputTwiceRemedy"},
    {Say::LabelNotDrawn, "check.labelNotDrawn"},
    {Say::LabelNotDrawnRemedy, "check.labelNotDrawnRemedy"},
    {Say::OutputNotWritten, "check.outputNotWritten"},
    {Say::OutputFullRemedy, "check.outputFullRemedy"},
    {Say::OutputForbiddenRemedy, "check.outputForbiddenRemedy"},
    {Say::OutputNoFolderRemedy, "check.outputNoFolderRemedy"},
    {Say::OutputOtherRemedy, "check.outputOtherRemedy"},
    {Say::StandardOutput, "check.standardOutput"},
    {Say::ConditionsMissing, "check.conditionsMissing"},
    {Say::ConditionsMissingRemedy, "check.conditionsMissingRemedy"},
    {Say::ConditionsBroken, "check.conditionsBroken"},
    {Say::ConditionsBrokenRemedy, "check.conditionsBrokenRemedy"},
    {Say::UnknownKey, "check.unknownKey"},
    {Say::UnknownKeyRemedy, "check.unknownKeyRemedy"},
    {Say::NotText, "check.notText"},
    {Say::NotTextRemedy, "check.notTextRemedy"},
    {Say::NoTarget, "check.noTarget"},
    {Say::NoTargetRemedy, "check.noTargetRemedy"},
    {Say::DefaultUnknown, "check.defaultUnknown"},
    {Say::NoSuchCondition, "check.noSuchCondition"},
    {Say::ConditionIsPreset, "check.conditionIsPreset"},
    {Say::ConditionIsDataSet, "check.conditionIsDataSet"},
    {Say::DidYouMean, "check.didYouMean"},
    {Say::SeeList, "check.seeList"},
    {Say::NothingToHoldAgainst, "check.nothingToHoldAgainst"},
    {Say::NothingToHoldAgainstRemedy, "check.nothingToHoldAgainstRemedy"},
    {Say::NoSuchPreset, "check.noSuchPreset"},
    {Say::PresetIsCondition, "check.presetIsCondition"},
    {Say::NoSuchDataSet, "check.noSuchDataSet"},
    {Say::NoSuchDataSetRemedy, "check.noSuchDataSetRemedy"},
    {Say::AmbiguousDataSet, "check.ambiguousDataSet"},
    {Say::AmbiguousDataSetRemedy, "check.ambiguousDataSetRemedy"},
    {Say::ListConditions, "check.listConditions"},
    {Say::ListNoConditions, "check.listNoConditions"},
    {Say::ListDefault, "check.listDefault"},
    {Say::ListPresets, "check.listPresets"},
    {Say::ListNoPresets, "check.listNoPresets"},
    {Say::ListDataSets, "check.listDataSets"},
    {Say::ListNoDataSets, "check.listNoDataSets"},
    {Say::ListPatches, "check.listPatches"},
    {Say::ListProfile, "check.listProfile"},
    {Say::ListLookedIn, "check.listLookedIn"},
    {Say::WatchStarts, "check.watchStarts"},
    {Say::WatchEnds, "check.watchEnds"},
    {Say::WatchFolderGone, "check.watchFolderGone"},
    {Say::WatchFolderGoneRemedy, "check.watchFolderGoneRemedy"},
    {Say::WatchNotPossible, "check.watchNotPossible"},
    {Say::WatchNotPossibleRemedy, "check.watchNotPossibleRemedy"},
    {Say::WatchBusy, "check.watchBusy"},
    {Say::WatchBusyRemedy, "check.watchBusyRemedy"},
    {Say::WatchLost, "check.watchLost"},
    {Say::NothingToVerify, "check.nothingToVerify"},
    {Say::WatchAndFiles, "check.watchAndFiles"},
    {Say::OnlyWithWatch, "check.onlyWithWatch"},
    {Say::QuietOrJson, "check.quietOrJson"},
    {Say::OutIsFile, "check.outIsFile"},
    {Say::NoSuchLanguage, "check.noSuchLanguage"}};

/// True if the sentences are complete and in the order of their names.
constexpr bool isComplete() {
    std::size_t place = 0;
    for (const Sentence& sentence : sentences) {
        if (static_cast<std::size_t>(sentence.what) != place++) {
            return false;
        }
    }
    return place == static_cast<std::size_t>(Say::Count);
}
static_assert(isComplete());

struct Chosen {
    languages::Texts sentences = languages::english();
    languages::Texts results = languages::english();
};

Chosen& chosen() {
    static Chosen texts;
    return texts;
}

} // namespace

void useLanguages(languages::Language ofSentences, languages::Language ofResults) {
    chosen() = {languages::Texts(ofSentences), languages::Texts(ofResults)};
}

const languages::Texts& texts() {
    return chosen().results;
}

std::string sayOnPage(Say what) {
    return texts()(sentences[static_cast<std::size_t>(what)].key);
}

std::string say(Say what, std::initializer_list<std::string_view> values) {
    static constexpr std::string_view places[] = {"1", "2", "3"};
    std::vector<languages::Value> list;
    for (const std::string_view value : values) {
        list.emplace_back(places[list.size()], value);
    }
    return chosen().sentences(sentences[static_cast<std::size_t>(what)].key, list);
}

} // namespace check
