// How often a test that leaves something to chance takes it.
#pragma once

#include <cstdlib>

/// TINTGATE_ROUNDS asks for more rounds than those that every run of the tests takes.
inline int roundsOr(int usual) {
    const char* wanted = std::getenv("TINTGATE_ROUNDS");
    return wanted == nullptr ? usual : std::atoi(wanted);
}
