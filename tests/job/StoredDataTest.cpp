// SPDX-License-Identifier: Apache-2.0
// Loads through a real store, the real plug-in and the real connector.
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "tests/job/JobOnStore.h"

namespace {

class StoredData : public JobOnStore {
  protected:
    StoredData() { m_record.jobID = job; }
    ~StoredData() override { processor->FreeMeasurementData(m_record); }

    /// Two patches, two wavelengths; all values from `first` on.
    void setMeasurement(const std::string& root, int first) const {
        std::ostringstream records;
        const auto add = [&](const std::string& name, int count) {
            records << ' ' << root << name << '=' << first++ << ".0";
            for (; count > 1; --count) {
                records << ',' << first++ << ".0";
            }
        };
        records << root << "Numpatches=2 " << root << "SpectralValues/Base=380 " << root
                << "SpectralValues/Stepsize=10 " << root << "SpectralValues/Length=2";
        add("SpectralValues/DValues", 4);
        for (const std::string group : {"XYZ", "Lab", "CMYK"}) {
            for (const char letter : group) {
                add(group + "Values/" + static_cast<char>(std::toupper(letter)) + "Values", 2);
            }
        }
        set(records.str());
    }

    /// Code, number of patches, mark of spectra, then what the arrays hold.
    std::string load(int (KZVerifyJobProcessor::*loader)(KZJobDataStruct*)) {
        std::ostringstream text;
        text << (*processor.*loader)(&m_record);
        const measurementDataRecord& record = m_record.measurement;
        text << " " << record.numPatches << " " << record.hasSpectral << " spectra";
        const auto show = [&](const char* name, const double* values, long count) {
            text << " " << name;
            for (long i = 0; values != nullptr && i < count; ++i) {
                text << (i == 0 ? " " : ",") << values[i];
            }
        };
        for (int i = 0; record.spectral != nullptr && i < record.numPatches; ++i) {
            const spectralRow& row = record.spectral[i];
            text << " " << row.base << "/" << row.stepsize << "/" << row.length;
            show(":", row.values, row.length);
        }
        show("xyz", record.xyz, 3L * record.numPatches);
        show("lab", record.lab, 3L * record.numPatches);
        show("cmyk", record.cmyk, 4L * record.numPatches);
        return text.str();
    }
    std::string loadMeasurements() { return load(&KZVerifyJobProcessor::LoadKZJobMeasurements); }
    std::string loadReferences() { return load(&KZVerifyJobProcessor::LoadKZJobReferences); }

    KZJobDataStruct m_record;
};

TEST_F(StoredData, LoadsTheValuesOfItsStrip) {
    setMeasurement("Remote/Measurement/", 1);
    setMeasurement("Remote/Measurement2/", 101);
    m_record.secondStrip = 2;
    EXPECT_EQ(loadMeasurements(),
              "0 2 1 spectra 380/10/2 : 101,102 380/10/2 : 103,104 xyz 105,107,109,106,108,110 "
              "lab 111,113,115,112,114,116 cmyk 117,119,121,123,118,120,122,124");
}

TEST_F(StoredData, GoesOnWithoutWhatIsMissing) {
    const std::string spectra = "0 2 1 spectra 380/10/2 : 1,2 380/10/2 : 3,4";
    const std::string xyz = " xyz 5,7,9,6,8,10";
    const std::string rest = xyz + " lab 11,13,15,12,14,16 cmyk 17,19,21,23,18,20,22,24";
    const std::string zeros = " xyz 0,0,0,0,0,0 lab 0,0,0,0,0,0 cmyk 0,0,0,0,0,0,0,0";
    const std::string empty = "spectra xyz lab cmyk";
    const std::pair<const char*, std::string> cases[] = {
        {"Numpatches=2", spectra + rest},
        {"Numpatches=-", "-1 0 0 " + empty},
        {"Numpatches=1000001", "0 1000001 0 " + empty},
        {"SpectralValues/Base=-", "-1 2 0 spectra 0/0/0 : 0/0/0 :" + zeros},
        {"SpectralValues/Length=37", "0 2 0 spectra" + rest},
        {"SpectralValues/Length=0", "0 2 1 spectra 380/10/0 : 380/10/0 :" + rest},
        {"SpectralValues/DValues=1.0,2.0,3.0", "0 2 0 spectra 380/10/2 : 0,0 0/0/0 :" + rest},
        {"XYZValues/XValues=-", spectra + " xyz 0,7,9,0,8,10" + rest.substr(xyz.size())},
    };
    for (const auto& [change, expected] : cases) {
        setMeasurement("Remote/Measurement/", 1);
        set("Remote/Measurement/" + std::string(change));
        EXPECT_EQ(loadMeasurements(), expected) << change;
    }
}

TEST_F(StoredData, LoadsReferencesInWholePercent) {
    const std::string root = "Remote/Measurement2/Reference/";
    setMeasurement(root, 1);
    set(root + "Numpatches=3 " + root + "CMYKValues/CValues=0,1,2 " + root +
        "CMYKValues/MValues=3,254,255 " + root +
        "CMYKValues/YValues=128,70000,-3 " + // A 16-bit number of percent.
        root + "CMYKValues/KValues=1.0,2.0,3.0");
    EXPECT_EQ(loadReferences(), "-1 0 0 spectra xyz lab cmyk") << "the first strip has none";
    m_record.secondStrip = 1;
    EXPECT_EQ(loadReferences(), "0 3 0 spectra xyz 5,7,9,6,8,10,0,0,0 lab 11,13,15,12,14,16,0,0,0 "
                                "cmyk 0,1,50,0,0,100,27451,0,1,100,65535,0");
}

} // namespace
