// SPDX-License-Identifier: Apache-2.0
// An option's name and its value are on separate lines. The password is always present, and only it
// is quoted (C60):
//
//     -apnm
//     Nerova Verify
//     -pwd
//     ""
#include "measure/MeasureOptions.h"

#include <string_view>

#include "base/WideBytes.h"

namespace {

struct Option {
    const char* name;
    wxString NerovaMeasureParams::*value;
};

constexpr Option options[] = {
    {"-apnm", &NerovaMeasureParams::apnm},
    {"-l", &NerovaMeasureParams::l},
    {"-s", &NerovaMeasureParams::s},
    {"-user", &NerovaMeasureParams::user},
    {"-pwd", &NerovaMeasureParams::pwd},
    {"-i", &NerovaMeasureParams::i},
    {"-j", &NerovaMeasureParams::j},
    {"-m", &NerovaMeasureParams::m},
    {"-chart", &NerovaMeasureParams::chart},
    {"-chartwidth", &NerovaMeasureParams::chartwidth},
    {"-chartheight", &NerovaMeasureParams::chartheight},
    {"-paper", &NerovaMeasureParams::paper},
    {"-width", &NerovaMeasureParams::width},
    {"-height", &NerovaMeasureParams::height},
    {"-o", &NerovaMeasureParams::o},
    {"-patch", &NerovaMeasureParams::patch},
    {"-patchname", &NerovaMeasureParams::patchname},
    {"-testmode", &NerovaMeasureParams::testmode},
    {"-ncolorref", &NerovaMeasureParams::ncolorref},
    {"-optdevlink", &NerovaMeasureParams::optdevlink},
    {"-opJPFile", &NerovaMeasureParams::opJPFile},
    {"-showjpuialltimes", &NerovaMeasureParams::showjpuialltimes},
    {"-nomeasureshowdata", &NerovaMeasureParams::nomeasureshowdata},
    {"-measit8", &NerovaMeasureParams::measit8},
    {"-createchart4meas", &NerovaMeasureParams::createchart4meas},
    {"-forcemeasure", &NerovaMeasureParams::forcemeasure},
    {"-previewjpgfile", &NerovaMeasureParams::previewjpgfile},
    {"-previewheightratio", &NerovaMeasureParams::previewheightratio},
    {"-chartsonly", &NerovaMeasureParams::chartsonly},
    {"-chartspath", &NerovaMeasureParams::chartspath},
    {"-completepagesize", &NerovaMeasureParams::completepagesize},
    {"-nosettingspage", &NerovaMeasureParams::nosettingspage},
    {"-iterationcount", &NerovaMeasureParams::iterationcount},
    {"-path2copyinputit8", &NerovaMeasureParams::path2copyinputit8},
    {"-givebackpatchinfo", &NerovaMeasureParams::givebackpatchinfo},
    {"-lcanonic", &NerovaMeasureParams::lcanonic},
    {"-isnerovakzserver", &NerovaMeasureParams::isnerovakzserver},
    {"-kzlogintype", &NerovaMeasureParams::kzlogintype},
    {"-eplpath", &NerovaMeasureParams::eplpath},
    {"-automatic", &NerovaMeasureParams::automatic},
    {"-wfid", &NerovaMeasureParams::wfid},
    {"-jobname", &NerovaMeasureParams::jobname},
    {"-visualchart", &NerovaMeasureParams::visualchart},
    {"-taglinefile", &NerovaMeasureParams::taglinefile},
    {"-showpdfwfpatch", &NerovaMeasureParams::showpdfwfpatch},
    {"-showOnly918patch", &NerovaMeasureParams::showOnly918patch},
    {"-warmupcopiescount", &NerovaMeasureParams::warmupcopiescount},
    {"-add2it8", &NerovaMeasureParams::add2it8},
    {"-disablechartsize", &NerovaMeasureParams::disablechartsize},
    {"-measuresetcount", &NerovaMeasureParams::measuresetcount},
    {"-showils", &NerovaMeasureParams::showils},
    {"-knownpatch", &NerovaMeasureParams::knownpatch},
    {"-appmetajson", &NerovaMeasureParams::appmetajson},
    {"-showalphaindicators", &NerovaMeasureParams::showalphaindicators},
    {"-ismeasdeviceils", &NerovaMeasureParams::ismeasdeviceils},
    {"-mediapresetname", &NerovaMeasureParams::mediapresetname},
    {"-outputdevicename", &NerovaMeasureParams::outputdevicename},
    {"-iteration", &NerovaMeasureParams::iteration},
    {"-outputprofile", &NerovaMeasureParams::outputprofile},
    {"-colorspace", &NerovaMeasureParams::colorspace},
    {"-outputprofileid", &NerovaMeasureParams::outputprofileid},
    {"-dontshowtc1617chart", &NerovaMeasureParams::dontshowtc1617chart},
    {"-xorigin", &NerovaMeasureParams::xorigin},
    {"-yorigin", &NerovaMeasureParams::yorigin},
    {"-forceWhiteFlood", &NerovaMeasureParams::forceWhiteFlood},
};

constexpr std::string_view password = "-pwd";

} // namespace

std::string measure::optionsText(const NerovaMeasureParams& params) {
    std::string text;
    for (const auto& [name, member] : options) {
        const std::string value = base::bytesFromWide((params.*member).ToStdWstring());
        if (name == password) {
            text.append(name).append("\n\"").append(value).append("\"\n");
        } else if (!value.empty()) {
            text.append(name).append("\n").append(value).append("\n");
        }
    }
    return text;
}
