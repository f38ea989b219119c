// SPDX-License-Identifier: Apache-2.0
// What any program on the wx base library costs to start and end: the measure for -version.

#include <wx/string.h>

int main(int argc, char* argv[]) {
    return argc > 1 && wxString(argv[1]).empty() ? 1 : 0;
}
