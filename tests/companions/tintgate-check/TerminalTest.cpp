// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Terminal.h"

#include <gtest/gtest.h>

// Widths are those of UAX #11: wide characters take two columns, combining ones none.
TEST(Terminal, AlignsColumnsOfAnyScript) {
    EXPECT_EQ(report::tableText({{{"ベタ"}, {"1"}}, {{"Volltöne"}, {"2"}}, {{"e\u0301 墨"}, {"3"}}},
                                report::Painter(false)),
              "  ベタ      1\n"
              "  Volltöne  2\n"
              "  e\u0301 墨      3\n");
}
