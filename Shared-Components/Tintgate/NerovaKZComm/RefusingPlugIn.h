// SPDX-License-Identifier: Apache-2.0
// What stands in for the plug-in where it could not be loaded.
#pragma once

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"

/// Initialize and Uninitialize succeed and no server ever answers, so that a login ends as with a
/// server that can't be reached. There are no tickets; everything else fails.
extern ComGUIModuleInterface refusingPlugIn;
