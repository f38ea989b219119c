// SPDX-License-Identifier: Apache-2.0
// Replaces the plug-in if it could not be loaded.
#pragma once

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"

/// Initialize and Uninitialize succeed, but no server answers, so a login fails as with an
/// unreachable server. There are no tickets, and everything else fails.
extern ComGUIModuleInterface refusingPlugIn;
