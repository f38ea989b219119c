// SPDX-License-Identifier: Apache-2.0
// The cost of starting and ending any program with the wx base library: the peer of -version.

#include <wx/string.h>

int main(int argc, char* argv[]) {
    return argc > 1 && wxString(argv[1]).empty() ? 1 : 0;
}
