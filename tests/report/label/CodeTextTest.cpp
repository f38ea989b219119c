// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "Samples.h"
#include "report/label/CodeText.h"

namespace {

using label::Match;

const std::string hash = label::hashOf("abc");

report::Result resultOf(const std::string& file) {
    report::Result result;
    result.verdict = report::Verdict::Failed;
    result.measurement.path = "/m/" + file;
    return result;
}

TEST(CodeText, HashesAsTheStandardSays) {
    // The example of FIPS 180-2, appendix B.1.
    EXPECT_EQ(hash, "BA7816BF8F01CFEA414140DE5DAE2223B00361A396177A9CB410FF61F20015AD");
}

TEST(CodeText, IsAsciiAndComesBackAsItWas) {
    struct {
        const char* file;
        const char* subject;
    } const cases[] = {
        {"proof.txt", "FILE:proof.txt"},
        {"a b%20.txt", "FILE:a%20b%2520.txt"},
        {"grün\xFF.txt", "FILE:gr%C3%BCn%FF.txt"},
        {"", "FILE:"},
        {"123456789012345678901234567890123456789012345678901234.txt",
         "FILE:12345678901234567890123456789012345678901234567890123.."},
        {"123456789012345678901234567890123456789012345678901ü.txt",
         "FILE:123456789012345678901234567890123456789012345678901.."},
    };
    for (const auto& [file, subject] : cases) {
        SCOPED_TRACE(file);
        const report::Result result = resultOf(file);
        const label::CodeText code = {result.verdict, "2024-05-01T12:34", hash,
                                      label::subjectOf(result, nullptr)};
        EXPECT_EQ(code.subject, subject);
        EXPECT_LE(code.subject.size(), 60u);
        const std::string text = label::writeCodeText(code);
        EXPECT_EQ(text, "TINTGATE/1 FAILED 2024-05-01T12:34 SHA256:" + hash + " " + subject);
        for (const std::string& scanned : {text, text + "\n", "QR-Code:" + text + "\r\n"}) {
            const auto read = label::readCodeText(scanned);
            ASSERT_TRUE(read);
            EXPECT_EQ(label::writeCodeText(*read), text);
            EXPECT_EQ(label::compareCodeText(*read, result, nullptr, hash), Match::Same);
        }
    }
}

TEST(CodeText, MatchesOneResultAndNotesWhatWasAltered) {
    const report::Result result = resultOf("proof.txt");
    report::Meta meta;
    meta.created = "2024-05-01T12:34:56+02:00";
    meta.jobId = 4711;
    meta.strip = 2;
    const std::string file = " SHA256:" + hash + " FILE:proof.txt";
    const std::string job = " SHA256:" + hash + " JOB:4711/2";
    const std::string created = "TINTGATE/1 FAILED 2024-05-01T12:34:56+02:00";
    struct {
        std::string text;
        const report::Meta* meta;
        Match match;
    } const cases[] = {
        {"TINTGATE/1 FAILED -" + file, nullptr, Match::Same},
        {"TINTGATE/1 FAILED 2020-01-01" + file, nullptr, Match::Same},
        {"TINTGATE/1 PASSED -" + file, nullptr, Match::Altered},
        {"TINTGATE/1 FAILED - SHA256:" + hash + " FILE:other.txt", nullptr, Match::Altered},
        {"TINTGATE/1 FAILED - SHA256:" + label::hashOf("abd") + " FILE:proof.txt", nullptr,
         Match::OtherResult},
        {created + job, &meta, Match::Same},
        {created + job, nullptr, Match::Same}, // nothing here knows the job
        {created + " SHA256:" + hash + " JOB:4711/1", &meta, Match::Altered},
        {"TINTGATE/1 FAILED 2024-05-02T12:34:56+02:00" + job, &meta, Match::Altered},
        {"TINTGATE/1 FAILED -" + job, &meta, Match::Altered},
    };
    for (const auto& [text, known, match] : cases) {
        const auto read = label::readCodeText(text);
        ASSERT_TRUE(read) << text;
        EXPECT_EQ(label::compareCodeText(*read, result, known, hash), match) << text;
    }
}

TEST(CodeText, RefusesWhatIsNoLabels) {
    const std::string good = "TINTGATE/1 PASSED - SHA256:" + hash + " JOB:1/1";
    ASSERT_TRUE(label::readCodeText(good));
    for (const std::string& text :
         {std::string(), std::string("https://example.org"), "TINTGATE/2" + good.substr(10),
          good + " more", good.substr(0, good.size() - 7), good.substr(0, 60),
          "TINTGATE/1 passed - SHA256:" + hash + " JOB:1/1",
          "TINTGATE/1 PASSED today SHA256:" + hash + " JOB:1/1",
          "TINTGATE/1 PASSED 2024-05-01T SHA256:" + hash + " JOB:1/1",
          "TINTGATE/1  PASSED - SHA256:" + hash + " JOB:1/1",
          "TINTGATE/1 PASSED - SHA256:" + hash.substr(1) + "G JOB:1/1",
          "TINTGATE/1 PASSED - SHA256:" + hash.substr(1) + " JOB:1/1"}) {
        EXPECT_FALSE(label::readCodeText(text)) << text;
    }
}

} // namespace
