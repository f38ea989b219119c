// SPDX-License-Identifier: Apache-2.0
// Reading CxF3 against pugixml's own parse of the same bytes.
#include <cstdio>
#include <cstdlib>
#include <random>
#include <string>

#include <pugixml.hpp>

#include "Fastest.h"
#include "colour/Cxf.h"

using namespace colour;

namespace {

std::string makeFile(std::size_t objects, bool withSpectra) {
    std::mt19937 engine(1); // NOLINT: the same patches each time
    std::uniform_real_distribution<double> unit(0, 1);
    const auto number = [&](const char* format, double value) {
        char text[32];
        std::snprintf(text, sizeof text, format, value);
        return std::string(text);
    };
    const auto element = [](const char* name, const std::string& text) {
        return std::string("<cc:") + name + ">" + text + "</cc:" + name + ">\n";
    };
    std::string file = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<cc:CxF xmlns:cc=\"http://"
                       "colorexchangeformat.com/CxF3-core\">\n<cc:Resources>\n"
                       "<cc:ObjectCollection>\n";
    for (std::size_t i = 0; i < objects; ++i) {
        file += "<cc:Object ObjectType=\"M1_Measurement\" Name=\"Patch " + std::to_string(i) +
                "\" Id=\"c" + std::to_string(i) + "\">\n<cc:ColorValues>\n";
        if (withSpectra) {
            file += "<cc:ReflectanceSpectrum StartWL=\"380\" ColorSpecification=\"m1\">";
            for (int band = 0; band < 36; ++band) {
                file += number("%.6f ", unit(engine));
            }
            file += "</cc:ReflectanceSpectrum>\n";
        }
        file += "<cc:ColorCIELab ColorSpecification=\"m1\">\n";
        for (const char* name : {"L", "A", "B"}) {
            file += element(name, number("%.2f", 100 * unit(engine)));
        }
        file += "</cc:ColorCIELab>\n</cc:ColorValues>\n<cc:DeviceColorValues>\n"
                "<cc:ColorCMYK ColorSpecification=\"press\">\n";
        for (const char* name : {"Cyan", "Magenta", "Yellow", "Black"}) {
            file += element(name, number("%.0f", 100 * unit(engine)));
        }
        file += "</cc:ColorCMYK>\n</cc:DeviceColorValues>\n</cc:Object>\n";
    }
    return file +
           "</cc:ObjectCollection>\n<cc:ColorSpecificationCollection>\n"
           "<cc:ColorSpecification Id=\"m1\"><cc:MeasurementSpec><cc:WavelengthRange "
           "StartWL=\"380\" Increment=\"10\"/></cc:MeasurementSpec></cc:ColorSpecification>\n"
           "</cc:ColorSpecificationCollection>\n</cc:Resources>\n</cc:CxF>\n";
}

double parse(const std::string& text) {
    pugi::xml_document document;
    if (!document.load_buffer(text.data(), text.size())) {
        std::abort();
    }
    return document.document_element() ? 1 : 0;
}

double read(const std::string& text) {
    DataSet set;
    if (readCxf(text, {}, set) != Failure::None) {
        std::abort();
    }
    return static_cast<double>(set.patchCount);
}

void compare(const char* what, const std::string& text) {
    const double bare = bench::fastest([&] { return parse(text); });
    const double ours = bench::fastest([&] { return read(text); });
    std::printf("%-44s %8.2f ms  bare %8.2f ms  ratio %.2f\n", what, ours, bare, ours / bare);
}

} // namespace

int main() {
    compare("1,617 objects", makeFile(1617, false));
    compare("100,000 objects", makeFile(100'000, false));
    compare("100,000 objects with spectra", makeFile(100'000, true));
    return 0;
}
