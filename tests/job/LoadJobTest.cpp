// SPDX-License-Identifier: Apache-2.0
// Loads jobs: a ticket in; the record, the job's folder and the code out.
#include <filesystem>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tests/job/JobOnStore.h"

namespace {

/// The result of a load, by name. A file is shown as the server path of its original.
using Members = std::map<std::string, std::string>;

/// Every file of the server contains its own path, so that a copy shows its origin.
constexpr char serverFiles[] =
    "ControlCharts/.it8 ControlCharts/abc.it8 ControlCharts/nest.it8 ControlCharts/strip.it8 "
    "IT8_CharacterizationData/Fogra_MKCheck10/x_MKCheck10_MKCheck11.it8 "
    "IT8_CharacterizationData/Fogra_MKCheck11/MKCheck11.it8 IT8_CharacterizationData/chart.it8 "
    "a(TEMP)/MKCheck10.it8 dyn/dyn.it8 dyn/dyn.dcf dyn/dyn.pdf in/esko.it8 jdf/job.jdf "
    "jdf/whole.jdf profile.icc profile2.icc tickets/CVP_0007.xml tickets/CVP_0010.xml "
    "tickets/CVP_1000.xml";

// An ordinary job, not measured yet, with characterization data as its references.
constexpr char usualTicket[] =
    "System/InstallFolder='/s Input/Title='Title CMM/PaperName='Paper Workflow/Name='Flow "
    "Footer/Dynstrip/UseDynstrip=0 Footer/ControlstripFile='strip.it8 "
    "Workflow/Verify/MeasurementWorkflow=2 Workflow/Verify/CharacterizationData='chart.it8 "
    "Workflow/Verify/DeltaEMode=4 Workflow/Verify/ComparisonMethod=7 "
    "Remote/Measurement/Illumination/Mode=2 Remote/Measurement/Status=0 Input/SubType=0 "
    "Output/Jdf/FileName='job.jdf System/Folders/Temp='/s/jdf Remote/JDFName='/s/jdf//whole.jdf "
    "Job/Display/Status=0 Remote/ShowInVerifier=0 ";

constexpr char usualPreset[] =
    "Name='Proof Editable=1 ShowInClient=1 UsedForDynamicWedge=1 IlluminationCondition=3 "
    "FograPSDPreset=1 Values/UsedForResult=1,0,1 Values/Preset=1.5,2.5 Values/DecimalPlaces=2";

class LoadJob : public JobOnStore {
  protected:
    LoadJob() {
        std::istringstream names(serverFiles);
        for (std::string name; names >> name;) {
            const bool isStrip = name.find("ControlCharts/") == 0;
            std::istringstream text((isStrip ? "DEVICE 33\n/s/" : "/s/") + name);
            engine->putFile("/s/" + name, text);
        }
        setPreset(usualPreset);
        processor->m_workingDir = root.path("work");
        m_usual = load(usualTicket);
    }

    void setPreset(const std::string& records, int id = 7) const {
        engine->remove(27, id);
        engine->create(27, id);
        store::CachingStorage keep(engine);
        ASSERT_TRUE(keep.apply(27, id, support::RecordTable(records).records()));
    }

    /// The origin of a file in the job's folder. For a file that the tool wrote, its name.
    static std::string shown(const KZJobDataStruct& job, const wxString& path) {
        if (path.empty() || !path.StartsWith(job.tempDir)) {
            return path.utf8_string();
        }
        const std::string name = path.utf8_string().substr(job.tempDir.length());
        if (!support::exists(path.utf8_string())) {
            return name + "?";
        }
        const std::string contents = support::contentsOf(path.utf8_string());
        const std::string source = contents.substr(contents.rfind('\n') + 1);
        return source.ends_with(name) ? source : name + source;
    }

    template<class Values>
    static std::string list(const Values& values, int count) {
        std::ostringstream text;
        for (int i = 0; i < count; ++i) {
            text << (i == 0 ? "" : ",") << values[i];
        }
        return text.str();
    }

    /// Id, name, file, the ticket's four numbers, the used entries, limits and decimals; whether it
    /// is of the PSD kind.
    static std::string presetOf(const KZJobDataStruct& job) {
        const tolerancePresetParameterRecord& preset = job.tolerance;
        const int flags[] = {preset.editable, preset.showInClient, preset.usedForDynamicWedge,
                             preset.illuminationCondition};
        return std::to_string(job.presetID) + " " + preset.name.utf8_string() + " " +
               shown(job, preset.filePath) + " " + list(flags, 4) + " " +
               list(preset.usedForResult, 3) + " " + list(preset.presetValues, 3) + " " +
               list(preset.decimalPlaces, 2) + " " + std::to_string(preset.fograPSDPreset);
    }

    static Members membersOf(const KZJobDataStruct& job, int code) {
        const std::string preset = presetOf(job);
        return {{"code", std::to_string(code)},
                {"inline", std::to_string(job.inlineVerifyJob)},
                {"type", std::to_string(job.jobType)},
                {"parent", std::to_string(job.parentID)},
                {"dynstrip", std::to_string(job.useDynstrip)},
                {"device", std::to_string(job.deviceID)},
                {"nested", std::to_string(job.nestedStrip)},
                {"children", list(job.childJobIDs, job.childJobCount)},
                {"workflow", std::to_string(job.measurementWorkflow)},
                {"status", std::to_string(job.measurementStatus)},
                {"mode", std::to_string(job.illuminationMode)},
                {"texts", (job.title + "," + job.workflowName + "," + job.paperName).utf8_string()},
                {"strip", shown(job, job.controlStripFile)},
                {"dynfile", shown(job, job.dynstripFile)},
                {"reference", shown(job, job.referenceFile)},
                {"psd", job.psdAssessment.utf8_string()},
                {"jdf", shown(job, job.jdfLocalFile)},
                {"jdfServer", job.jdfServerFile.utf8_string()},
                {"patches", std::to_string(job.measurement.numPatches)},
                {"measured", list(job.measuredValues, 3)},
                {"formula", std::to_string(job.tolerance.deltaEMode)},
                {"preset", preset == presetOf({}) ? "none" : preset}};
    }

    /// Loads a new job with this ticket.
    Members load(const std::string& ticket, int secondStrip = 0) {
        const int id = ++m_lastJob;
        engine->create(3, id);
        set(ticket, id);
        KZJobDataStruct job;
        job.secondStrip = secondStrip;
        const int code = processor->LoadKZJobData(id, &job);
        EXPECT_EQ(job.jobID, id);
        EXPECT_EQ(job.tempDir.utf8_string(), root.path("work/JobID_" + std::to_string(id)));
        EXPECT_EQ(job.sampleFile, job.tempDir + "/Measured sample.txt");
        EXPECT_EQ(job.instrumentName, "Instrument " + std::to_string(job.deviceID));
        EXPECT_EQ(job.presetLocalFile,
                  job.presetFile.empty() ? wxString() : job.tempDir + "/" + job.presetFile);
        EXPECT_TRUE(job.tolerance.presetID == job.presetID || job.presetFile.empty());
        const Members members = membersOf(job, code);
        processor->FreeMeasurementData(job);
        std::free(job.childJobIDs);
        return members;
    }

    static std::string differences(const Members& before, const Members& members) {
        std::string text;
        for (const auto& [name, value] : members) {
            if (value != before.at(name)) {
                text += (text.empty() ? "" : " ") + name + "=" + value;
            }
        }
        return text;
    }

    struct Case {
        std::string changes; ///< Changes to the usual ticket.
        std::string outcome; ///< The members that differ as a result.
    };

    void expectOutcomes(const std::vector<Case>& cases, int secondStrip = 0) {
        for (const auto& [changes, outcome] : cases) {
            EXPECT_EQ(differences(m_usual, load(usualTicket + changes, secondStrip)), outcome)
                << changes;
        }
    }

    int m_lastJob = 100;
    Members m_usual;
};

TEST_F(LoadJob, AnUsualJob) {
    // The preset is not of the PSD kind, even if its ticket says so.
    EXPECT_EQ(differences(membersOf({}, 0), m_usual),
              "device=33 formula=4 jdf=/s/jdf/job.jdf jdfServer=/s/jdf/job.jdf mode=2 "
              "preset=7 Proof /s/tickets/CVP_0007.xml 1,1,1,3 1,0,1 1.5,2.5,0 2,0 0 "
              "reference=/s/IT8_CharacterizationData/chart.it8 strip=/s/ControlCharts/strip.it8 "
              "texts=Title,Flow,Paper workflow=2");
}

TEST_F(LoadJob, FindsTheControlStrip) {
    const std::string name = "Footer/ControlstripFile=";
    const std::string nested = " Footer/Nesting/ControlstripFile='nest.it8";
    const std::string dynamic = "Footer/Dynstrip/UseDynstrip=1 ";
    expectOutcomes({
        {name + "'/any/where/abc.ti3" + nested, "strip=/s/ControlCharts/abc.it8"},
        {name + "'abc" + nested, "strip=/s/ControlCharts/nest.it8"},
        // Without a strip, there is no workflow, so no references and no preset.
        {name + "'abc", "device=0 formula=0 preset=none reference= strip= workflow=0"},
        {name + "'none.it8", "device=0 strip="},
        {dynamic, "device=0 dynstrip=1 reference= strip= workflow=0"},
        {dynamic + "Footer/Dynstrip/DeviceID=13 Footer/Dynstrip/IT8='/s//dyn/dyn.it8 "
                   "Footer/Dynstrip/File='/s/dyn/dyn.pdf",
         "device=13 dynfile=/s/dyn/dyn.pdf dynstrip=1 mode=0 reference=/s/dyn/dyn.it8 "
         "strip=/s/dyn/dyn.it8"},
        {dynamic + "Footer/Dynstrip/DeviceID=14 Footer/Dynstrip/IT8='/s//dyn/dyn.it8",
         "device=14 dynstrip=1 reference=/s/dyn/dyn.it8 strip=/s/dyn/dyn.it8 workflow=0"},
    });
    EXPECT_EQ(support::contentsOf(root.path("work/JobID_" + std::to_string(m_lastJob) +
                                            "/NMPatchSetDefinition.dcf")),
              "/s/dyn/dyn.dcf");
}

TEST_F(LoadJob, FindsReferences) {
    const std::string workflow = "Workflow/Verify/MeasurementWorkflow=";
    const std::string chart = "Workflow/Verify/CharacterizationData=";
    const std::string first = " Footer/ControlstripInputProfile=";
    const std::string other = " Remote/UsedICCProfile='/s/profile2.icc";
    const std::string stored = workflow + "3 Remote/Measurement/Reference/Numpatches=";
    const std::string esko = workflow + "4 Job/FromEsko=1 ";
    expectOutcomes({
        {chart + "'MKCheck11.it8",
         "reference=/s/IT8_CharacterizationData/Fogra_MKCheck11/MKCheck11.it8"},
        {chart + "'x_MKCheck10_MKCheck11.it8",
         "reference=/s/IT8_CharacterizationData/Fogra_MKCheck10/x_MKCheck10_MKCheck11.it8"},
        {chart + "'/s/a(TEMP)//MKCheck10.it8", "reference=/s/a(TEMP)/MKCheck10.it8"},
        {chart + "-", "formula=0 preset=none reference="},
        {workflow + "4", "formula=0 preset=none reference= workflow=4"},
        {workflow + "1" + first + "'/s/profile.icc" + other, "reference=/s/profile.icc workflow=1"},
        {workflow + "1" + first + "'" + other, "reference=/s/profile2.icc workflow=1"},
        {workflow + "1" + first + "'\xff" + other, "reference= workflow=1"},
        {stored + "2" + other, "reference=/s/profile2.icc workflow=3"}, // Not measured yet.
        {stored + "2 Remote/Measurement/Status=2",
         "patches=2 reference=/Measured reference.txt status=2 type=3 workflow=3"},
        {esko, "formula=0 jdf= preset=none reference= workflow=4"},
        {esko + "Footer/ControlstripIT8='/s/in/esko.it8",
         "jdf= reference= strip=/s/in/esko.it8 workflow=4"},
        {esko + "Footer/ControlstripIT8='\xff", "jdf= reference= workflow=4"},
        {esko + "Footer/ControlstripIT8='/s/in/esko.it8 " + chart + "-",
         "jdf= reference=/s/ControlCharts/strip.it8 strip=/s/in/esko.it8 workflow=4"},
    });
}

TEST_F(LoadJob, GoesOnWithoutWhatIsMissing) {
    expectOutcomes({
        {"Remote/Measurement/Illumination/Mode='two Remote/Measurement/Status='many "
         "CMM/PaperName=- Workflow/Name=7 Input/Title=-",
         "mode=1 texts=,,"},
        // Without an install folder, the following switch is not read, but lookups continue.
        {"System/InstallFolder=- Footer/Dynstrip/UseDynstrip=1 "
         "Workflow/Verify/CharacterizationData='/s/a(TEMP)/MKCheck10.it8",
         "device=0 preset=7 Proof  1,1,1,3 1,0,1 1.5,2.5,0 2,0 0 "
         "reference=/s/a(TEMP)/MKCheck10.it8 strip="},
    });
}

TEST_F(LoadJob, ReadsThePresetUpToWhatIsMissing) {
    const std::string other = "Workflow/Verify/ComparisonMethod=";
    const struct {
        std::string preset;
        std::string changes;
        std::string outcome;
    } cases[] = {
        {"Name='Proof UsedForDynamicWedge=1 Values/UsedForResult=1.0 Values/Preset=1.5,2.5,3.5 "
         "Values/DecimalPlaces='two",
         "", "preset=7 Proof /s/tickets/CVP_0007.xml 0,0,0,0 0,0,0 1.5,2.5,3.5 0,0 0"},
        {"Name=' Editable=1", "Input/SubType=80", "preset=7   0,0,0,0 0,0,0 0,0,0 0,0 0"},
        {usualPreset, "Workflow/Verify/DeltaEMode=-", "formula=0 preset=none"},
        {usualPreset, other + "-", "preset=none"},
        {usualPreset, other + "8", "preset=8   0,0,0,0 0,0,0 0,0,0 0,0 0"},
    };
    for (const auto& [preset, changes, outcome] : cases) {
        setPreset(preset);
        expectOutcomes({{changes, outcome}});
    }
    for (const std::string id : {"10", "1000"}) {
        setPreset("Name='Proof", std::stoi(id));
        const std::string path = "/s/tickets/CVP_" + std::string(4 - id.size(), '0') + id + ".xml";
        expectOutcomes(
            {{other + id, "preset=" + id + " Proof " + path + " 0,0,0,0 0,0,0 0,0,0 0,0 0"}});
    }
}

TEST_F(LoadJob, TakesAParentsStrip) {
    const std::string nested = "General/ParentID=5 Footer/Nesting/PSDAssessment='p "
                               "Footer/Nesting/ControlstripFile='nest.it8 "
                               "Footer/Nesting/ControlstripMode=";
    for (const auto& [id, ticket] : std::map<int, std::string>{
             {50, "General/ParentID=5 Job/Display/Status=208"},
             {51, "General/ParentID=6 Job/Display/Status=208"},
             {52, "General/ParentID=5 Job/Display/Status=212 Remote/ShowInVerifier=0"},
             {53, "General/ParentID=5 Job/Display/Status=212 Remote/ShowInVerifier=1"},
             {54, "Job/Display/Status=208"}}) {
        engine->create(3, id);
        set(ticket, id);
    }
    expectOutcomes({
        {nested + "2", "parent=5 psd=p"},
        {nested + "1", "children=50,53 nested=1 parent=5 psd=p strip=/s/ControlCharts/nest.it8"},
        {nested + "1 General/ParentID=-1", "parent=-1"},
        {nested + "1 Footer/Nesting/PSDAssessment=-", "parent=5"},
        {nested + "1 Footer/Nesting/ControlstripFile='none.it8", "parent=5 psd=p"},
    });
}

TEST_F(LoadJob, DecidesTheType) {
    const std::string sub = "Input/SubType=";
    const std::string status = " Remote/Measurement/Status=";
    const std::string stored = " Workflow/Verify/MeasurementWorkflow=3 "
                               "Remote/Measurement/Reference/Numpatches=1";
    const std::string whole = "jdf=/s/jdf/whole.jdf jdfServer=/s/jdf//whole.jdf ";
    expectOutcomes({
        {status + "1", "status=1 type=2"},
        {sub + "80", whole + "type=1"},
        {sub + "81" + status + "5", whole + "status=5 type=1"},
        {sub + "82" + status + "2", "status=2 type=3"},
        {sub + "81" + stored + status + "2",
         "patches=1 reference=/Measured reference.txt status=2 type=3 workflow=3"},
        {sub + "96" + status + "1", "status=1 type=2"},
        {sub + "96" + status + "-3", "status=-3"},
    });
}

// Measured while printing: values and mode come from the ticket, and nothing is to be measured.
TEST_F(LoadJob, KnowsInlineInstruments) {
    const std::string device = "Input/SubType=96 Footer/Dynstrip/UseDynstrip=1 "
                               "Footer/Dynstrip/IT8='/s/dyn/dyn.it8 "
                               "Footer/Dynstrip/File='/s/dyn/dyn.pdf Footer/Dynstrip/DeviceID=";
    const std::string values = " Remote/Measurement/Values/Measured=1.5,2.5 "
                               "Output/Prn/Specific/Measurement/VerifyMode=6";
    const std::string dynamic = " dynfile=/s/dyn/dyn.pdf dynstrip=1 ";
    const std::string files = "reference=/s/dyn/dyn.it8 strip=/s/dyn/dyn.it8";
    expectOutcomes({
        {device + "0", "device=0" + dynamic + "inline=1 mode=-1 " + files + " type=2"},
        {device + "39" + values, "device=39" + dynamic + files},
        {device + "40" + values,
         "device=40" + dynamic + "inline=1 measured=1.5,2.5,0 mode=6 " + files + " type=2"},
        {device + "47 Remote/Measurement/Status=2",
         "device=47" + dynamic +
             "inline=1 mode=-1 reference=/s/dyn/dyn.it8 status=2 "
             "strip=/s/dyn/dyn.it8 type=3"},
        {device + "48" + values, "device=48" + dynamic + files},
    });
}

TEST_F(LoadJob, FetchesTheJdf) {
    const std::string other = " Workflow/RemoteOutFolder=";
    expectOutcomes({
        {"Output/Jdf/FileName='none.jdf Job/FromEsko=1", "jdf= jdfServer=/s/jdf/none.jdf"},
        {"Input/SubType=86 Remote/JDFName=-", "code=-1 jdf= jdfServer= type=1"},
        {"System/Folders/Temp=-", "code=-1 jdf= jdfServer="},
        {"System/Folders/Temp='" + other + "'/s//jdf", "jdfServer=/s//jdf/job.jdf"},
        {"System/Folders/Temp='\xff" + other + "'/s/jdf", "code=111 jdf= jdfServer="},
    });
}

TEST_F(LoadJob, TheSecondStripHasKeysOfItsOwn) {
    const std::string second = "Footer/ControlstripFile2='abc.it8 Workflow/Verify/DeltaEMode2=5 "
                               "Workflow/Verify/ComparisonMethod2=7 ";
    const std::vector<Case> cases = {
        {second + "Workflow/Verify/MeasurementWorkflow2=1 Footer/Dynstrip/UseDynstrip=1 "
                  "Footer/ControlstripInputProfile2='/s/profile2.icc General/ParentID=5 "
                  "Remote/Measurement2/Illumination/Mode=4 Remote/Measurement2/Status=2 "
                  "Footer/Nesting/ControlstripMode=1 Footer/Nesting/PSDAssessment='p "
                  "Footer/Nesting/ControlstripFile2='nest.it8",
         "dynstrip=1 formula=5 mode=4 nested=1 parent=5 psd=p reference=/s/profile2.icc status=2 "
         "strip=/s/ControlCharts/nest.it8 type=3 workflow=1"},
        {second + "Workflow/Verify/MeasurementWorkflow2=2 "
                  "Workflow/Verify/CharacterizationData2='MKCheck11.it8",
         "formula=5 mode=1 reference=/s/IT8_CharacterizationData/Fogra_MKCheck11/MKCheck11.it8 "
         "strip=/s/ControlCharts/abc.it8"},
        {second + "Workflow/Verify/MeasurementWorkflow2=3 Remote/Measurement2/Status=1 "
                  "Remote/Measurement2/Reference/Numpatches=2",
         "formula=5 mode=1 patches=2 reference=/Measured reference.txt status=1 "
         "strip=/s/ControlCharts/abc.it8 type=2 workflow=3"},
    };
    expectOutcomes(cases, 1);
    expectOutcomes({cases[0]}, -1);
}

// Required. The fixture's processor was the first to ask.
TEST_F(LoadJob, OnlyTheFirstProcessorHasAFolder) {
    EXPECT_EQ(processor->SetWorkingDir(), wxString());
    const support::ScratchFolder temporary;
    setenv("TMPDIR", (temporary.path() + "//").c_str(), 1);
    EXPECT_EQ(myMkTmpDirName().utf8_string(), temporary.path("Tintgate"));
    EXPECT_TRUE(std::filesystem::is_directory(temporary.path("Tintgate")));
    EXPECT_EQ(myMkTmpDirName(), wxString());
    unsetenv("TMPDIR");
}

} // namespace
