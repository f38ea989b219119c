// SPDX-License-Identifier: Apache-2.0
#include <string>

#include "CheckTest.h"

namespace {

using namespace checktest;
using testing::HasSubstr;

TEST_F(CheckTest, WritesLabelsAndCertificatesThatBelongToTheirResults) {
    m_scratch.write("home/.config/tintgate/conditions.toml", R"(
default = "proof"
[conditions.proof]
target = "FOGRA39L"
paper = "Paper 235"
printer = "Proofer 2"
)");
    for (int i = 0; i < 6; ++i) {
        m_scratch.write("in/proof" + std::to_string(i) + ".txt", wedge(i % 2 * 8));
    }
    const std::string customers = m_scratch.write("in/proof5.pdf", "%PDF-1.4 of the customer");
    const auto run = [&] {
        return check({"in", "-j", "3", "--label=png", "--label-dpi", "203", "--label-size",
                      "62x100mm", "--pdf", "--result", "--operator", "Anna"});
    };
    // Nobody else's file is replaced, our own ones are.
    for (int times = 0; times < 2; ++times) {
        const support::Outcome outcome = run();
        EXPECT_EQ(outcome.exitCode, 3) << outcome.error;
        EXPECT_EQ(support::contentsOf(customers), "%PDF-1.4 of the customer");
    }
    for (int i = 0; i < 5; ++i) {
        SCOPED_TRACE(i);
        const std::string stem = m_scratch.path("in/proof" + std::to_string(i));
        const std::string text =
            support::run({"zbarimg", "--quiet", "--raw", "--nodbus", stem + ".label.png"}).output;
        EXPECT_THAT(text, HasSubstr(i % 2 == 0 ? " PASSED 20" : " FAILED 20"));
        EXPECT_EQ(support::run({TINTGATE_REPORT, stem + ".json", "--match", text}).exitCode, 0);
        const std::string sheet = support::run({"pdftotext", stem + ".pdf", "-"}).output;
        for (const char* part : {"proof (", "Paper 235", "Proofer 2", "Anna", "Criteria"}) {
            EXPECT_THAT(sheet, HasSubstr(part));
        }
    }

    EXPECT_THAT(
        check({"in/proof0.txt", "--label"}).output,
        testing::AllOf(HasSubstr("Label: in/proof0.label.pdf"), testing::Not(HasSubstr("Page:"))));
    m_scratch.write("in/proof1.label.pdf", "mine");
    EXPECT_EQ(check({"in/proof1.txt", "--label"}).exitCode, 3);
    EXPECT_EQ(support::contentsOf(m_scratch.path("in/proof1.label.pdf")), "mine");
    for (const char* option : {"--label=gif", "--label-size=5x5", "--label-dpi=1", "--sheet=A3"}) {
        EXPECT_EQ(check({"in/proof0.txt", option}).exitCode, 64) << option;
    }
}

} // namespace
