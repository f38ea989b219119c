// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/Failure.h"

namespace measuretool {

const char* wordsFor(colour::Failure failure) {
    switch (failure) {
    case colour::Failure::Missing:
        return "does not exist";
    case colour::Failure::TooLarge:
        return "is too large";
    case colour::Failure::NotRecognised:
        return "is neither CGATS text nor an ICC profile";
    case colour::Failure::Damaged:
        return "is damaged or cut off";
    case colour::Failure::NoPatches:
        return "has no patches";
    case colour::Failure::NoColourValues:
    case colour::Failure::SpectraUnusable:
        return "has no usable colour values";
    case colour::Failure::NoDeviceValues:
        return "has no device values";
    case colour::Failure::NotNumeric:
        return "has text in place of a number";
    case colour::Failure::ProfileDamaged:
        return "is not an intact ICC profile";
    case colour::Failure::ProfileClass:
        return "is a profile of a class that does not describe prints";
    case colour::Failure::ProfileColourSpace:
        return "is not a CMYK profile";
    case colour::Failure::ProfileUnusable:
        return "is a profile that yields no colours";
    default:
        return "can't be read";
    }
}

void expectUsable(colour::Failure failure, Status status, const std::string& path) {
    if (failure == colour::Failure::None) {
        return;
    }
    if (failure == colour::Failure::OutOfMemory) {
        status = Status::OutOfMemory;
    }
    throw Failure(status, path + " " + wordsFor(failure));
}

} // namespace measuretool
