// Loads through a real store, the real plug-in and the real connector.
#include <filesystem>
#include <functional>
#include <sstream>
#include <vector>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "SuiteRoot.h"
#include "comgui/StoreEngine.h"
#include "comgui/Users.h"
#include "job/JobTicket.h"
#include "job/KZVerifyJobProcessor.h"
#include "platform/WideBytes.h"

namespace {

using Doubles = std::vector<double>;
using Integers = std::vector<int>;

class StoredData : public testing::Test {
  protected:
    static constexpr int job = 7;

    StoredData() {
        setenv("TMPDIR", m_root.path().c_str(), 1);
        m_root.installPlistReader(PLIST_READER);
        m_root.writePreferences("Qen/com.qen.packageversion.plist",
                                {{"Nerova Hue Workbench/library_path", m_root.path("suite")}});
        std::filesystem::create_directories(m_root.path("suite/lib"));
        std::filesystem::create_directory_symlink(COMGUI_BUNDLE,
                                                  m_root.path("suite/lib/ComGUI.Bundle"));
        const std::string address = m_root.path("store");
        store::makeStore(address, "Press room");
        const auto engine = store::openStore(address);
        engine->putUser({"press", store::passwordHash("room"), false});
        engine->create(JobTicket::jobType, job);
        m_processor.m_connector = new CKZConnector(platform::wideFromBytes(address), L"press",
                                                   L"room", 0x5071103, false, false);
        EXPECT_TRUE(m_processor.m_connector->IsLoggedIn());
        m_record.jobID = job;
    }
    ~StoredData() override { m_processor.FreeMeasurementData(m_record); }

    JobTicket ticket() const { return {m_processor.m_connector, job}; }

    void set(const std::string& key, int value) const { ticket().write(key, value); }
    void set(const std::string& key, const char* text) const {
        ticket().write(key, std::string(text));
    }
    template<class T>
    void set(const std::string& key, const std::vector<T>& values) const {
        ticket().writeArray(key, static_cast<int>(values.size()), values.data());
    }
    void remove(const std::string& key) const {
        m_processor.m_connector->SetJobTicketKeyValue(JobTicket::jobType, job, key.c_str(),
                                                      PARAM_DELETE, nullptr, POSITION_WHOLE);
    }

    /// Two patches, two wavelengths; all values from `first` on.
    void setMeasurement(const std::string& root, double first) const {
        set(root + "Numpatches", 2);
        set(root + "SpectralValues/Base", 380);
        set(root + "SpectralValues/Stepsize", 10);
        set(root + "SpectralValues/Length", 2);
        const auto values = [&first](int count) {
            Doubles values;
            for (int i = 0; i < count; ++i) {
                values.push_back(first++);
            }
            return values;
        };
        set(root + "SpectralValues/DValues", values(4));
        for (const char* name :
             {"XYZValues/XValues", "XYZValues/YValues", "XYZValues/ZValues", "LabValues/LValues",
              "LabValues/AValues", "LabValues/BValues", "CMYKValues/CValues", "CMYKValues/MValues",
              "CMYKValues/YValues", "CMYKValues/KValues"}) {
            set(root + name, values(2));
        }
    }

    /// Code, number of patches, mark of spectra, then what the arrays hold.
    std::string load(int (KZVerifyJobProcessor::*loader)(KZJobDataStruct*)) {
        std::ostringstream text;
        text << (m_processor.*loader)(&m_record);
        const measurementDataRecord& record = m_record.measurement;
        text << " " << record.numPatches << " " << record.hasSpectral;
        const auto show = [&](const char* name, const double* values, int rows, int width) {
            text << " " << name;
            for (int i = 0; values != nullptr && i < rows * width; ++i) {
                text << (i == 0 ? " " : ",") << values[i];
            }
        };
        text << " spectra";
        for (int i = 0; record.spectral != nullptr && i < record.numPatches; ++i) {
            const spectralRow& row = record.spectral[i];
            text << " " << row.base << "/" << row.stepsize << "/" << row.length;
            show(":", row.values, 1, row.length);
        }
        show("xyz", record.xyz, record.numPatches, 3);
        show("lab", record.lab, record.numPatches, 3);
        show("cmyk", record.cmyk, record.numPatches, 4);
        return text.str();
    }
    std::string loadMeasurements() { return load(&KZVerifyJobProcessor::LoadKZJobMeasurements); }
    std::string loadReferences() { return load(&KZVerifyJobProcessor::LoadKZJobReferences); }

    const support::SuiteRoot m_root;
    KZVerifyJobProcessor m_processor;
    KZJobDataStruct m_record;
};

TEST_F(StoredData, LoadsAMeasurementOfEitherStrip) {
    setMeasurement("Remote/Measurement/", 1);
    setMeasurement("Remote/Measurement2/", 101);
    EXPECT_EQ(loadMeasurements(), "0 2 1 spectra 380/10/2 : 1,2 380/10/2 : 3,4 xyz 5,7,9,6,8,10 "
                                  "lab 11,13,15,12,14,16 cmyk 17,19,21,23,18,20,22,24");
    m_record.secondStrip = 2;
    EXPECT_EQ(loadMeasurements(),
              "0 2 1 spectra 380/10/2 : 101,102 380/10/2 : 103,104 xyz 105,107,109,106,108,110 "
              "lab 111,113,115,112,114,116 cmyk 117,119,121,123,118,120,122,124");
    m_record.jobID = -1;
    const double* const before = m_record.measurement.xyz;
    EXPECT_EQ(m_processor.LoadKZJobMeasurements(&m_record), 0);
    EXPECT_EQ(m_processor.LoadKZJobReferences(&m_record), 0);
    EXPECT_EQ(m_record.measurement.xyz, before);
    EXPECT_EQ(m_record.measurement.numPatches, 2);
}

TEST_F(StoredData, GoesOnWithoutWhatIsMissing) {
    const std::string spectra = "spectra 380/10/2 : 1,2 380/10/2 : 3,4";
    const std::string xyz = " xyz 5,7,9,6,8,10";
    const std::string lab = " lab 11,13,15,12,14,16";
    const std::string cmyk = " cmyk 17,19,21,23,18,20,22,24";
    const std::string rest = xyz + lab + cmyk;
    const std::string zeros = " xyz 0,0,0,0,0,0 lab 0,0,0,0,0,0 cmyk 0,0,0,0,0,0,0,0";
    const std::string empty = "spectra xyz lab cmyk";
    const std::string firstOnly = "spectra 380/10/2 : 0,0 0/0/0 :";
    const struct {
        const char* key;
        std::function<void(const std::string& key)> change;
        std::string expected;
    } cases[] = {
        {"Numpatches", [&](auto& key) { remove(key); }, "-1 0 0 " + empty},
        {"Numpatches", [&](auto& key) { set(key, -2); }, "0 0 0 " + empty},
        {"Numpatches", [&](auto& key) { set(key, 2000000000); }, "0 2000000000 0 " + empty},
        {"Numpatches", [&](auto& key) { set(key, 1000001); }, "0 1000001 0 " + empty},
        {"SpectralValues/Base", [&](auto& key) { remove(key); },
         "-1 2 0 spectra 0/0/0 : 0/0/0 :" + zeros},
        {"SpectralValues/Length", [&](auto& key) { set(key, "2"); },
         "-1 2 0 spectra 380/0/0 : 0/0/0 :" + zeros},
        {"SpectralValues/Length", [&](auto& key) { set(key, 37); }, "0 2 0 spectra" + rest},
        {"SpectralValues/Length", [&](auto& key) { set(key, -1); }, "0 2 0 spectra" + rest},
        {"SpectralValues/Length", [&](auto& key) { set(key, 0); },
         "0 2 1 spectra 380/10/0 : 380/10/0 :" + rest},
        {"SpectralValues/DValues",
         [&](auto& key) {
             set(key, Doubles{1, 2, 3});
         },
         "0 2 0 " + firstOnly + rest},
        {"SpectralValues/DValues",
         [&](auto& key) {
             set(key, Doubles{1, 2, 3, 4, 5});
         },
         "0 2 1 " + spectra + rest},
        {"XYZValues/XValues", [&](auto& key) { remove(key); },
         "0 2 1 " + spectra + " xyz 0,7,9,0,8,10" + lab + cmyk},
        {"LabValues/AValues", [&](auto& key) { set(key, Doubles{1.5}); },
         "0 2 1 " + spectra + xyz + " lab 11,1.5,15,12,0,16" + cmyk},
        {"CMYKValues/KValues",
         [&](auto& key) {
             set(key, Doubles{1.5, 2.5, 3.5});
         },
         "0 2 1 " + spectra + rest.substr(0, rest.find(" cmyk")) +
             " cmyk 17,19,21,1.5,18,20,22,2.5"},
    };
    for (const auto& [key, change, expected] : cases) {
        setMeasurement("Remote/Measurement/", 1);
        change(std::string("Remote/Measurement/") + key);
        EXPECT_EQ(loadMeasurements(), expected) << key;
    }
}

TEST_F(StoredData, LoadsReferencesInWholePercent) {
    setMeasurement("Remote/Measurement/", 1);
    const std::string root = "Remote/Measurement2/Reference/";
    setMeasurement(root, 1);
    set(root + "Numpatches", 3);
    set(root + "CMYKValues/CValues", Integers{0, 1, 2});
    set(root + "CMYKValues/MValues", Integers{3, 254, 255});
    set(root + "CMYKValues/YValues", Integers{128, 70000, -3}); // A 16-bit number of percent.
    set(root + "CMYKValues/KValues", Doubles{1, 2, 3});
    EXPECT_EQ(loadReferences(), "-1 0 0 spectra xyz lab cmyk") << "the first strip has none";
    m_record.secondStrip = 1;
    EXPECT_EQ(loadReferences(), "0 3 0 spectra xyz 5,7,9,6,8,10,0,0,0 lab 11,13,15,12,14,16,0,0,0 "
                                "cmyk 0,1,50,0,0,100,27451,0,1,100,65535,0");

    set(root + "Numpatches", 2000000000);
    EXPECT_EQ(loadReferences(), "0 2000000000 0 spectra xyz lab cmyk");

    // One record holds one data set at a time.
    set("Remote/Measurement/Reference/Numpatches", 1);
    m_record.secondStrip = 0;
    loadMeasurements();
    EXPECT_EQ(loadReferences(), "0 1 0 spectra xyz 0,0,0 lab 0,0,0 cmyk 0,0,0,0");
    set("Remote/Measurement/Numpatches", 0);
    EXPECT_EQ(loadMeasurements(), "0 0 0 spectra xyz lab cmyk");
}

} // namespace
