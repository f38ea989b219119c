// A ticket in; the record, the job's folder and the code out.
#include <filesystem>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tests/job/JobOnStore.h"

namespace {

using Members = std::map<std::string, std::string>;

/// Every file of the server holds its own path, so that a copy tells where it came from.
constexpr const char* serverFiles[] = {
    "ControlCharts/.it8",
    "ControlCharts/abc.it8",
    "ControlCharts/nest.it8",
    "ControlCharts/strip.it8",
    "ControlCharts/strip2.it8",
    "IT8_CharacterizationData/Fogra_MKCheck10/x_MKCheck10_MKCheck11.it8",
    "IT8_CharacterizationData/Fogra_MKCheck11/MKCheck11.it8",
    "IT8_CharacterizationData/chart.it8",
    "a(TEMP)/MKCheck10.it8",
    "dyn/dyn.it8",
    "dyn/dyn.dcf",
    "dyn/dyn.pdf",
    "in/esko.it8",
    "jdf/job.jdf",
    "jdf/whole.jdf",
    "profile.icc",
    "profile2.icc",
    "tickets/CVP_0007.xml",
};

// An ordinary job, not measured so far, with characterisation data as its references.
constexpr char usualTicket[] =
    "System/InstallFolder='/s Input/Title='Title CMM/PaperName='Paper Workflow/Name='Flow "
    "Footer/Dynstrip/UseDynstrip=0 Footer/ControlstripFile='strip.it8 "
    "Footer/ControlstripFile2='strip2.it8 Workflow/Verify/MeasurementWorkflow=2 "
    "Workflow/Verify/CharacterizationData='chart.it8 Workflow/Verify/DeltaEMode=4 "
    "Workflow/Verify/ComparisonMethod=7 Remote/Measurement/Illumination/Mode=2 "
    "Remote/Measurement/Status=0 Input/SubType=0 Output/Jdf/FileName='job.jdf "
    "System/Folders/Temp='/s/jdf Remote/JDFName='/s/jdf//whole.jdf "
    "Job/Display/Status=0 Remote/ShowInVerifier=0 ";

constexpr char usualPreset[] =
    "Name='Proof Editable=1 ShowInClient=1 UsedForDynamicWedge=1 IlluminationCondition=3 "
    "FograPSDPreset=1 Values/UsedForResult=1,0,1 Values/Preset=1.5,2.5 Values/DecimalPlaces=2";

/// How the outcome of a load that never came to the preset differs.
constexpr char withoutPreset[] =
    "tolerance.decimals=0,0 tolerance.file= tolerance.fileName= tolerance.flags=0,0,0 "
    "tolerance.formula=0 tolerance.id=0 tolerance.illumination=0 tolerance.job=0 tolerance.local= "
    "tolerance.name= tolerance.used=0,0,0,0 tolerance.values=0,0,0";

class LoadJob : public JobOnStore {
  protected:
    LoadJob() {
        for (const std::string name : serverFiles) {
            const bool isStrip = name.find("ControlCharts/") == 0;
            std::istringstream text((isStrip ? "DEVICE 33\n/s/" : "/s/") + name);
            engine->putFile("/s/" + name, text);
        }
        setPreset(usualPreset);
        processor->m_workingDir = root.path("work");
        m_usual = load(usualTicket);
    }

    void setPreset(const std::string& records) const {
        engine->remove(27, 7);
        engine->create(27, 7);
        store::StoreKeep keep(engine);
        ASSERT_TRUE(keep.apply(27, 7, support::RecordTable(records).records()));
    }

    /// A path without the job's folder, which every job has of its own, and where its file is from.
    std::string shown(const KZJobDataStruct& job, const wxString& path) const {
        std::string text = path.utf8_string();
        if (!support::exists(text)) {
            return path.StartsWith(job.tempDir) ? text.substr(job.tempDir.length()) + "?" : text;
        }
        const std::string contents = support::contentsOf(text);
        return text.substr(job.tempDir.length()) + "<" + contents.substr(contents.rfind('\n') + 1);
    }

    Members membersOf(const KZJobDataStruct& job, int code) const {
        const auto& tolerance = job.tolerance;
        const auto list = [](const auto& values, int count) {
            std::string text;
            for (int i = 0; i < count; ++i) {
                std::ostringstream value;
                value << values[i];
                text += (i == 0 ? "" : ",") + value.str();
            }
            return text;
        };
        Members members;
        const auto add = [&](const char* name, const auto& value) {
            std::ostringstream text;
            text << value;
            members[name] = text.str();
        };
        add("code", code);
        add("inline", job.inlineVerifyJob);
        add("type", job.jobType);
        add("parent", job.parentID);
        add("dynstrip", job.useDynstrip);
        add("device", job.deviceID);
        add("nested", job.nestedStrip);
        add("children", list(job.childJobIDs, job.childJobCount));
        add("tolerance.job", job.presetID);
        add("workflow", job.measurementWorkflow);
        add("status", job.measurementStatus);
        add("illumination", job.illuminationMode);
        add("title", job.title.utf8_string());
        add("flow", job.workflowName.utf8_string());
        add("instrument", job.instrumentName.utf8_string());
        add("strip", shown(job, job.controlStripFile));
        add("dynfile", shown(job, job.dynstripFile));
        add("tolerance.fileName", job.presetFile.utf8_string());
        add("tolerance.local", shown(job, job.presetLocalFile));
        add("reference", shown(job, job.referenceFile));
        add("sample", shown(job, job.sampleFile));
        add("psd", job.psdAssessment.utf8_string());
        add("paper", job.paperName.utf8_string());
        add("jdf", shown(job, job.jdfLocalFile));
        add("jdfServer", job.jdfServerFile.utf8_string());
        add("patches", job.measurement.numPatches);
        add("measured", list(job.measuredValues, 3));
        add("tolerance.file", shown(job, tolerance.filePath));
        add("tolerance.id", tolerance.presetID);
        add("tolerance.name", tolerance.name.utf8_string());
        add("tolerance.flags", list(std::vector{tolerance.editable, tolerance.showInClient,
                                                tolerance.usedForDynamicWedge},
                                    3));
        add("tolerance.formula", tolerance.deltaEMode);
        add("tolerance.illumination", tolerance.illuminationCondition);
        add("tolerance.psd", tolerance.fograPSDPreset);
        add("tolerance.used", list(tolerance.usedForResult, 4));
        add("tolerance.values", list(tolerance.presetValues, 3));
        add("tolerance.decimals", list(tolerance.decimalPlaces, 2));
        return members;
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
        const Members members = membersOf(job, code);
        processor->FreeMeasurementData(job);
        std::free(job.childJobIDs);
        return members;
    }

    /// What a change of the usual ticket changes in the outcome.
    std::string outcomeOf(const std::string& changes, int secondStrip = 0) {
        std::string text;
        for (const auto& [name, value] : load(usualTicket + changes, secondStrip)) {
            if (value != m_usual.at(name)) {
                text += (text.empty() ? "" : " ") + name + "=" + value;
            }
        }
        const std::size_t at = text.find(withoutPreset);
        return at == std::string::npos ? text
                                       : text.replace(at, sizeof withoutPreset - 1, "no preset");
    }

    int m_lastJob = 100;
    Members m_usual;
};

struct Case {
    std::string changes;
    std::string outcome; ///< Members that differ from those of the usual ticket, by name.
};

#define EXPECT_OUTCOMES(cases)                                                                     \
    for (const auto& [changes, outcome] : cases) {                                                 \
        EXPECT_EQ(outcomeOf(changes), outcome) << changes;                                         \
    }

TEST_F(LoadJob, AnUsualJob) {
    const Members expected = {{"children", ""},
                              {"code", "0"},
                              {"device", "33"},
                              {"dynfile", ""},
                              {"dynstrip", "0"},
                              {"flow", "Flow"},
                              {"illumination", "2"},
                              {"inline", "0"},
                              {"instrument", "Instrument 33"},
                              {"jdf", "/job.jdf</s/jdf/job.jdf"},
                              {"jdfServer", "/s/jdf/job.jdf"},
                              {"measured", "0,0,0"},
                              {"nested", "0"},
                              {"paper", "Paper"},
                              {"parent", "0"},
                              {"patches", "0"},
                              {"tolerance.fileName", "CVP_0007.xml"},
                              {"tolerance.job", "7"},
                              {"tolerance.local", "/CVP_0007.xml</s/tickets/CVP_0007.xml"},
                              {"psd", ""},
                              {"reference", "/chart.it8</s/IT8_CharacterizationData/chart.it8"},
                              {"sample", "/Measured sample.txt?"},
                              {"status", "0"},
                              {"strip", "/strip.it8</s/ControlCharts/strip.it8"},
                              {"title", "Title"},
                              {"tolerance.decimals", "2,0"},
                              {"tolerance.file", "/CVP_0007.xml</s/tickets/CVP_0007.xml"},
                              {"tolerance.flags", "1,1,1"},
                              {"tolerance.formula", "4"},
                              {"tolerance.id", "7"},
                              {"tolerance.illumination", "3"},
                              {"tolerance.name", "Proof"},
                              {"tolerance.psd", "0"}, // Whatever the ticket says.
                              {"tolerance.used", "1,0,1,0"},
                              {"tolerance.values", "1.5,2.5,0"},
                              {"type", "0"},
                              {"workflow", "2"}};
    EXPECT_EQ(m_usual, expected);
}

TEST_F(LoadJob, FindsTheControlStrip) {
    const Case cases[] = {
        {"", ""},
        // Without an install folder nothing is found below it, and the key behind it is not read.
        // A key that is there with the wrong type is not there.
        {"Footer/ControlstripFile='/any/where/abc.ti3", "strip=/abc.it8</s/ControlCharts/abc.it8"},
        {"Footer/ControlstripFile='abc Footer/Nesting/ControlstripFile='nest",
         "strip=/nest.it8</s/ControlCharts/nest.it8"},
        {"Footer/ControlstripFile='abc.", "strip=/abc.it8</s/ControlCharts/abc.it8"},
        {"Footer/ControlstripFile=- Footer/Nesting/ControlstripFile='abc",
         "strip=/abc.it8</s/ControlCharts/abc.it8"},
        // Without a strip there is no workflow, and so no references and no preset.
        {"Footer/ControlstripFile='abc",
         "device=0 instrument=Instrument 0 reference= strip= no preset workflow=0"},
        {"Footer/ControlstripFile=- Footer/Nesting/ControlstripFile=5",
         "device=0 instrument=Instrument 0 reference= strip= no preset workflow=0"},
        {"Footer/ControlstripFile='none.it8", "device=0 instrument=Instrument 0 strip="},
        {"Footer/Dynstrip/UseDynstrip=-", ""},
        {"Footer/Dynstrip/UseDynstrip=2", "dynstrip=2"},
        {"Footer/Dynstrip/UseDynstrip=1",
         "device=0 dynstrip=1 instrument=Instrument 0 reference= strip= workflow=0"},
        {"Footer/Dynstrip/UseDynstrip=1 Footer/Dynstrip/DeviceID=13 "
         "Footer/Dynstrip/IT8='/s//dyn/dyn.it8 "
         "Footer/Dynstrip/File='/s/dyn/dyn.pdf",
         "device=13 dynfile=/dyn.pdf</s/dyn/dyn.pdf dynstrip=1 illumination=0 "
         "instrument=Instrument 13 reference=/dyn.it8</s/dyn/dyn.it8 "
         "strip=/dyn.it8</s/dyn/dyn.it8"},
        {"Footer/Dynstrip/UseDynstrip=1 Footer/Dynstrip/DeviceID=13 "
         "Footer/Dynstrip/IT8='/s//dyn/dyn.it8",
         "device=13 dynstrip=1 illumination=0 instrument=Instrument 13 "
         "reference=/dyn.it8</s/dyn/dyn.it8 strip=/dyn.it8</s/dyn/dyn.it8 workflow=0"},
    };
    EXPECT_OUTCOMES(cases);
}

TEST_F(LoadJob, FindsReferences) {
    const std::string workflow = "Workflow/Verify/MeasurementWorkflow=";
    const std::string chart = "Workflow/Verify/CharacterizationData=";
    const Case cases[] = {
        {chart + "'MKCheck11.it8",
         "reference=/MKCheck11.it8</s/IT8_CharacterizationData/Fogra_MKCheck11/MKCheck11.it8"},
        {chart + "'x_MKCheck10_MKCheck11.it8",
         "reference=/x_MKCheck10_MKCheck11.it8</s/IT8_CharacterizationData/Fogra_MKCheck10/"
         "x_MKCheck10_MKCheck11.it8"},
        {chart + "'/s/a(TEMP)//MKCheck10.it8", "reference=/MKCheck10.it8</s/a(TEMP)/MKCheck10.it8"},
        {chart + "'", "reference= no preset"},
        {chart + "-", "reference= no preset"},
        {chart + "'../chart.it8", "reference="},
        {workflow + "0", "reference= no preset workflow=0"},
        {workflow + "4", "reference= no preset workflow=4"},
        {workflow + "1", "reference= no preset workflow=1"},
        {workflow + "1 Footer/ControlstripInputProfile='/s/profile.icc",
         "reference=/profile.icc</s/profile.icc workflow=1"},
        {workflow + "1 Footer/ControlstripInputProfile=' Remote/UsedICCProfile='/s/profile2.icc",
         "reference=/profile2.icc</s/profile2.icc workflow=1"},
        {workflow + "1 Footer/ControlstripInputProfile='\xff Remote/UsedICCProfile='/s/profile.icc",
         "reference= workflow=1"},
        {workflow + "1 Remote/UsedICCProfile='/s/profile.icc Remote/Measurement/Status=1",
         "reference=/profile.icc</s/profile.icc status=1 type=2 workflow=1"},
        {workflow +
             "1 Remote/UsedICCProfile='/s/profile.icc Remote/Measurement/Status=1 Input/SubType=80",
         "reference=/profile.icc</s/profile.icc status=1 type=2 workflow=1"},
        {workflow + "3 Remote/UsedICCProfile='/s/profile.icc",
         "reference=/profile.icc</s/profile.icc workflow=3"},
        {workflow + "3 Remote/UsedICCProfile='/s/profile.icc Remote/Measurement/Status=1",
         "reference=/profile.icc</s/profile.icc status=1 type=2 workflow=3"},
        {workflow +
             "3 Remote/UsedICCProfile='/s/profile.icc Remote/Measurement/Reference/Numpatches=2",
         "reference=/profile.icc</s/profile.icc workflow=3"},
        {workflow + "3 Remote/Measurement/Status=2 Remote/Measurement/Reference/Numpatches=2 "
                    "Remote/Measurement/Reference/CMYKValues/CValues=255,0",
         "patches=2 reference=/Measured reference.txt< status=2 type=3 workflow=3"},
        {workflow +
             "3 Remote/Measurement/Status=1 Remote/Measurement/Reference/Numpatches=2000000000",
         "patches=2000000000 reference=/Measured reference.txt< status=1 no preset type=2 "
         "workflow=3"},
        {workflow + "4 Job/FromEsko=1", "jdf= reference= no preset workflow=4"},
        {workflow + "4 Job/FromEsko=1 Footer/ControlstripIT8='/s/in/esko.it8",
         "jdf= reference= strip=/esko.it8</s/in/esko.it8 workflow=4"},
        {workflow + "4 Job/FromEsko=1 Footer/ControlstripIT8='/s/in/esko.it8 " + chart + "-",
         "jdf= reference=/strip.it8</s/ControlCharts/strip.it8 strip=/esko.it8</s/in/esko.it8 "
         "workflow=4"},
        {workflow + "4 Job/FromEsko=1 Footer/ControlstripIT8='/s/in/esko.it8 " + chart +
             "'/s/profile.icc",
         "jdf= reference=/profile.icc</s/profile.icc strip=/esko.it8</s/in/esko.it8 workflow=4"},
        {workflow + "4 Job/FromEsko=1 Footer/ControlstripIT8=' " + chart + "'/s/profile.icc",
         "jdf= reference=/profile.icc</s/profile.icc no preset workflow=4"},
        {workflow + "4 Job/FromEsko=2", "jdf= reference= no preset workflow=4"},
    };
    EXPECT_OUTCOMES(cases);
}

// Device 13 and its like are read without illumination, whatever the ticket says.
TEST_F(LoadJob, ReadsTheKeysOfTheMeasurement) {
    const Case cases[] = {
        {"Remote/Measurement/Illumination/Mode=-", "illumination=1"},
        {"Remote/Measurement/Illumination/Mode='two", "illumination=1"},
        {"CMM/PaperName=- Workflow/Name=7 Input/Title=-", "flow= paper= title="},
        {"Remote/Measurement/Status=- Input/SubType=-", ""},
        {"Remote/Measurement/Status='many", ""},
        {"Job/FromEsko=1 Output/Jdf/FileName='none.jdf", "jdf= jdfServer=/s/jdf/none.jdf"},
        // Without an install folder the switch behind it is not read, and a lookup still made.
        {"System/InstallFolder=- Footer/Dynstrip/UseDynstrip=1 "
         "Workflow/Verify/CharacterizationData='/s/a(TEMP)/MKCheck10.it8",
         "device=0 instrument=Instrument 0 reference=/MKCheck10.it8</s/a(TEMP)/MKCheck10.it8 "
         "strip= tolerance.file= tolerance.local=/CVP_0007.xml?"},
    };
    EXPECT_OUTCOMES(cases);
}

TEST_F(LoadJob, ChoosesThePreset) {
    const struct {
        std::string preset;
        std::string changes;
        std::string outcome;
    } cases[] = {
        {"Name='Proof", "",
         "tolerance.decimals=0,0 tolerance.flags=0,0,0 tolerance.illumination=0 "
         "tolerance.used=0,0,0,0 tolerance.values=0,0,0"},
        {"Name=' Editable=1", "",
         "tolerance.decimals=0,0 tolerance.file= tolerance.fileName= tolerance.flags=0,0,0 "
         "tolerance.illumination=0 tolerance.local= tolerance.name= tolerance.used=0,0,0,0 "
         "tolerance.values=0,0,0"},
        {"Editable=1", "Input/SubType=80",
         "tolerance.decimals=0,0 tolerance.file= tolerance.fileName= tolerance.flags=0,0,0 "
         "tolerance.illumination=0 tolerance.local= tolerance.name= tolerance.used=0,0,0,0 "
         "tolerance.values=0,0,0"},
        {usualPreset, "Workflow/Verify/DeltaEMode=-", "no preset"},
        {usualPreset, "Workflow/Verify/ComparisonMethod=-",
         "tolerance.decimals=0,0 tolerance.file= tolerance.fileName= tolerance.flags=0,0,0 "
         "tolerance.id=0 tolerance.illumination=0 tolerance.job=0 tolerance.local= tolerance.name= "
         "tolerance.used=0,0,0,0 tolerance.values=0,0,0"},
        {usualPreset, "Workflow/Verify/ComparisonMethod=8",
         "tolerance.decimals=0,0 tolerance.file= tolerance.fileName= tolerance.flags=0,0,0 "
         "tolerance.id=8 tolerance.illumination=0 tolerance.job=8 tolerance.local= tolerance.name= "
         "tolerance.used=0,0,0,0 tolerance.values=0,0,0"},
        {"Name='Proof Editable=1 UsedForDynamicWedge=1 Values/Preset=1.5,2.5,3.5 "
         "Values/UsedForResult=1.0 Values/DecimalPlaces='two",
         "",
         "tolerance.decimals=0,0 tolerance.flags=1,0,0 tolerance.illumination=0 "
         "tolerance.used=0,0,0,0 tolerance.values=1.5,2.5,3.5"},
    };
    for (const auto& [preset, changes, outcome] : cases) {
        setPreset(preset);
        EXPECT_EQ(outcomeOf(changes), outcome) << preset << " " << changes;
    }
}

TEST_F(LoadJob, NamesThePresetsFileByFourDigits) {
    const std::pair<int, const char*> names[] = {
        {-5, "CVP_000-5.xml"}, {9, "CVP_0009.xml"},   {10, "CVP_0010.xml"},  {99, "CVP_0099.xml"},
        {100, "CVP_0100.xml"}, {999, "CVP_0999.xml"}, {1000, "CVP_1000.xml"}};
    for (const auto& [id, name] : names) {
        if (id >= 0) {
            engine->create(27, id);
            store::StoreKeep keep(engine);
            keep.apply(27, id, support::RecordTable("Name='Proof").records());
        }
        std::istringstream text("x");
        engine->putFile(std::string("/s/tickets/") + name, text);
        const std::string outcome =
            outcomeOf("Workflow/Verify/ComparisonMethod=" + std::to_string(id));
        EXPECT_EQ(outcome.find(std::string("tolerance.fileName=") + name) != std::string::npos,
                  id >= 0)
            << outcome;
    }
}

TEST_F(LoadJob, TakesAParentsStrip) {
    const std::string nested = "General/ParentID=5 Footer/Nesting/PSDAssessment='p "
                               "Footer/Nesting/ControlstripFile='nest.it8 ";
    for (const auto& [id, ticket] : std::map<int, std::string>{
             {50, "General/ParentID=5 Job/Display/Status=208"},
             {51, "General/ParentID=6 Job/Display/Status=208"},
             {52, "General/ParentID=5 Job/Display/Status=212 Remote/ShowInVerifier=0"},
             {53, "General/ParentID=5 Job/Display/Status=212 Remote/ShowInVerifier=1"},
             {54, "Job/Display/Status=208"}}) {
        engine->create(3, id);
        set(ticket, id);
    }
    const Case cases[] = {
        {nested, "parent=5 psd=p"},
        {nested + "Footer/Nesting/ControlstripMode=2", "parent=5 psd=p"},
        {nested + "Footer/Nesting/ControlstripMode=1",
         "children=50,53 nested=1 parent=5 psd=p strip=/nest.it8</s/ControlCharts/nest.it8"},
        {nested + "Footer/Nesting/ControlstripMode=1 General/ParentID=-1", "parent=-1"},
        {nested + "Footer/Nesting/ControlstripMode=1 Footer/Nesting/PSDAssessment=-", "parent=5"},
        {nested + "Footer/Nesting/ControlstripMode=1 Footer/Nesting/ControlstripFile='none.it8",
         "parent=5 psd=p"},
    };
    EXPECT_OUTCOMES(cases);
}

TEST_F(LoadJob, DecidesTheType) {
    const std::string stored = "Workflow/Verify/MeasurementWorkflow=3 "
                               "Remote/Measurement/Reference/Numpatches=1 ";
    const std::string dynamic = "Footer/Dynstrip/UseDynstrip=1 Footer/Dynstrip/IT8='/s/dyn/dyn.it8 "
                                "Footer/Dynstrip/File='/s/dyn/dyn.pdf Input/SubType=96 ";
    const std::string values = "Remote/Measurement/Values/Measured=1.5,2.5 ";
    const std::string mode = "Output/Prn/Specific/Measurement/VerifyMode=6 ";
    const auto device = [](int number) {
        return "Footer/Dynstrip/DeviceID=" + std::to_string(number) + " ";
    };
    const auto status = [](int number) {
        return "Remote/Measurement/Status=" + std::to_string(number) + " ";
    };
    const Case cases[] = {
        {status(1), "status=1 type=2"},
        {status(2), "status=2 type=3"},
        {status(-1), "status=-1"},
        {"Input/SubType=80", "jdf=/whole.jdf</s/jdf/whole.jdf jdfServer=/s/jdf//whole.jdf type=1"},
        {"Input/SubType=81 " + status(5),
         "jdf=/whole.jdf</s/jdf/whole.jdf jdfServer=/s/jdf//whole.jdf status=5 type=1"},
        {"Input/SubType=86 Remote/JDFName=-", "code=-1 jdf= jdfServer= type=1"},
        {"Input/SubType=86 Remote/JDFName='", "code=111 jdf= jdfServer= type=1"},
        {"Input/SubType=82 " + status(1), "status=1 type=2"},
        {"Input/SubType=81 " + stored + status(2),
         "patches=1 reference=/Measured reference.txt< status=2 type=3 workflow=3"},
        {"Input/SubType=81 " + stored + status(1),
         "jdf=/whole.jdf</s/jdf/whole.jdf jdfServer=/s/jdf//whole.jdf patches=1 "
         "reference=/Measured reference.txt< status=1 type=1 workflow=3"},
        {"Input/SubType=96 ", ""},
        {"Input/SubType=96 " + status(1), "status=1 type=2"},
        {"Input/SubType=96 " + status(2), "status=2 type=3"},
        {"Input/SubType=96 " + status(-3), "status=-3"},
        {dynamic + device(0), "device=0 dynfile=/dyn.pdf</s/dyn/dyn.pdf dynstrip=1 illumination=-1 "
                              "inline=1 instrument=Instrument 0 reference=/dyn.it8</s/dyn/dyn.it8 "
                              "strip=/dyn.it8</s/dyn/dyn.it8 type=2"},
        {dynamic + device(39) + values + mode,
         "device=39 dynfile=/dyn.pdf</s/dyn/dyn.pdf dynstrip=1 instrument=Instrument 39 "
         "reference=/dyn.it8</s/dyn/dyn.it8 strip=/dyn.it8</s/dyn/dyn.it8"},
        {dynamic + device(40) + values + mode,
         "device=40 dynfile=/dyn.pdf</s/dyn/dyn.pdf dynstrip=1 illumination=6 inline=1 "
         "instrument=Instrument 40 measured=1.5,2.5,0 reference=/dyn.it8</s/dyn/dyn.it8 "
         "strip=/dyn.it8</s/dyn/dyn.it8 type=2"},
        {dynamic + device(47) + mode + status(2),
         "device=47 dynfile=/dyn.pdf</s/dyn/dyn.pdf dynstrip=1 illumination=6 inline=1 "
         "instrument=Instrument 47 reference=/dyn.it8</s/dyn/dyn.it8 status=2 "
         "strip=/dyn.it8</s/dyn/dyn.it8 type=3"},
        {dynamic + device(48) + values + mode,
         "device=48 dynfile=/dyn.pdf</s/dyn/dyn.pdf dynstrip=1 instrument=Instrument 48 "
         "reference=/dyn.it8</s/dyn/dyn.it8 strip=/dyn.it8</s/dyn/dyn.it8"},
    };
    EXPECT_OUTCOMES(cases);
}

TEST_F(LoadJob, FetchesTheJdf) {
    const Case cases[] = {
        {"Output/Jdf/FileName=-", "code=-1 jdf= jdfServer="},
        {"Output/Jdf/FileName='none.jdf", "code=111 jdf= jdfServer="},
        {"System/Folders/Temp=-", "code=-1 jdf= jdfServer="},
        {"System/Folders/Temp=- Workflow/RemoteOutFolder='/s//jdf", "jdfServer=/s//jdf/job.jdf"},
        {"System/Folders/Temp=' Workflow/RemoteOutFolder='/s/jdf", ""},
        {"System/Folders/Temp='\xff Workflow/RemoteOutFolder='/s/jdf", "code=111 jdf= jdfServer="},
        {"System/Folders/Temp=' Workflow/RemoteOutFolder='", "code=111 jdf= jdfServer="},
        {"System/Folders/Temp=' Workflow/RemoteOutFolder=' Job/FromEsko=1", "jdf= jdfServer="},
    };
    EXPECT_OUTCOMES(cases);
}

TEST_F(LoadJob, TheSecondStripHasKeysOfItsOwn) {
    const std::string second =
        "Footer/ControlstripFile2='abc.it8 Workflow/Verify/MeasurementWorkflow2=1 "
        "Footer/ControlstripInputProfile2='/s/profile2.icc Workflow/Verify/DeltaEMode2=5 "
        "Workflow/Verify/ComparisonMethod2=7 Remote/Measurement2/Illumination/Mode=4 "
        "Remote/Measurement2/Status=2 Footer/Dynstrip/UseDynstrip=1 General/ParentID=5 "
        "Footer/Nesting/ControlstripMode=1 Footer/Nesting/PSDAssessment='p "
        "Footer/Nesting/ControlstripFile2='nest.it8 ";
    for (const int strip : {1, 2, -1}) {
        EXPECT_EQ(outcomeOf(second, strip),
                  "dynstrip=1 illumination=4 nested=1 parent=5 psd=p "
                  "reference=/profile2.icc</s/profile2.icc status=2 "
                  "strip=/nest.it8</s/ControlCharts/nest.it8 tolerance.formula=5 type=3 workflow=1")
            << strip;
    }
    EXPECT_EQ(outcomeOf("Workflow/Verify/MeasurementWorkflow2=2 Workflow/Verify/DeltaEMode2=5 "
                        "Workflow/Verify/ComparisonMethod2=7 "
                        "Workflow/Verify/CharacterizationData2='MKCheck11.it8",
                        1),
              "illumination=1 "
              "reference=/MKCheck11.it8</s/IT8_CharacterizationData/Fogra_MKCheck11/MKCheck11.it8 "
              "strip=/strip2.it8</s/ControlCharts/strip2.it8 tolerance.formula=5");
    EXPECT_EQ(
        outcomeOf("Workflow/Verify/MeasurementWorkflow2=3 Workflow/Verify/DeltaEMode2=5 "
                  "Workflow/Verify/ComparisonMethod2=7 Remote/Measurement2/Status=1 "
                  "Remote/Measurement2/Reference/Numpatches=2",
                  1),
        "illumination=1 patches=2 reference=/Measured reference.txt< status=1 "
        "strip=/strip2.it8</s/ControlCharts/strip2.it8 tolerance.formula=5 type=2 workflow=3");
}

// By requirement: the fixture's own has asked before.
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
