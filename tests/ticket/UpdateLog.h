// What update lists have written since the last look.
#pragma once

#include <string>

std::string takeUpdateLog();
