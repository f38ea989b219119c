// SPDX-License-Identifier: Apache-2.0
#include "analysis/Status.h"

#include "ExitCodes.h"

namespace analysis {
namespace {

using colour::Failure;

constexpr struct {
    Failure failure;
    ExitCode code;
} statuses[] = {
    {Failure::None, exitDone},
    {Failure::Missing, exitInputMissing},
    {Failure::Unreadable, exitInputUnreadable},
    {Failure::NotRecognised, exitInputNotRecognised},
    {Failure::XmlRefused, exitInputXmlRefused},
    {Failure::Damaged, exitInputDamaged},
    {Failure::TooLarge, exitInputTooLarge},
    {Failure::NoPatches, exitNoPatches},
    {Failure::NoColourValues, exitNoColourValues},
    {Failure::NoDeviceValues, exitNoDeviceValues},
    {Failure::NotNumeric, exitValueNotNumeric},
    {Failure::SpectraUnusable, exitSpectraUnusable},
    {Failure::ProfileDamaged, exitProfileDamaged},
    {Failure::ProfileClass, exitProfileWrongClass},
    {Failure::ProfileColourSpace, exitProfileWrongColourSpace},
    {Failure::ProfileUnusable, exitProfileUnusable},
    {Failure::NotWritable, exitOutputNotWritable},
    {Failure::Incomplete, exitOutputIncomplete},
    {Failure::OutOfMemory, exitOutOfMemory},
};

} // namespace

int statusOf(Failure failure) {
    for (const auto& status : statuses) {
        if (status.failure == failure) {
            return status.code;
        }
    }
    return exitInternalFailure;
}

} // namespace analysis
