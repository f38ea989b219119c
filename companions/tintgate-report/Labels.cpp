// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Labels.h"

#include <cstdint>
#include <ctime>

#include "companions/tintgate-report/Files.h"
#include "report/Page.h"

namespace report {
namespace {

/// 2024-05-01T12:34, or the day alone if the time is not known.
std::string stampOf(std::int64_t localSeconds) {
    constexpr std::int64_t secondsOfDay = 86400;
    const std::time_t time = localSeconds;
    std::tm parts{};
    gmtime_r(&time, &parts);
    char text[32];
    const bool isDay = localSeconds % secondsOfDay == 0;
    return {text, std::strftime(text, sizeof text, isDay ? "%Y-%m-%d" : "%Y-%m-%dT%H:%M", &parts)};
}

label::Subject subjectOf(const LoadedResult& loaded, const label::Details& details) {
    label::Subject subject{loaded.result, loaded.hash, loaded.metaOrNull()};
    subject.details = details;
    bool byFile = false;
    const std::int64_t time = timeOfResult(loaded, byFile);
    if (!byFile || loaded.path != "-") {
        subject.date = stampOf(time);
        subject.kindOfDate = byFile ? label::DateKind::Filed : label::DateKind::Measured;
    }
    return subject;
}

std::string listed(const std::vector<std::string>& words) {
    std::string text;
    for (const std::string& word : words) {
        text += (text.empty() ? "" : ", ") + word;
    }
    return text;
}

void write(const std::string& path, const label::Drawn& drawn,
           const std::function<void(const std::string&)>& say) {
    writeOutput(path, drawn.bytes);
    if (!drawn.leftOut.empty()) {
        say(path + " has no room for: " + listed(drawn.leftOut));
    }
    if (drawn.criteriaCounted > 0) {
        say(path + " lists the first criteria and counts " + std::to_string(drawn.criteriaCounted) +
            " more");
    }
    if (drawn.unknownCharacters > 0) {
        say(path + " has characters that no installed font has; the package fonts-noto-cjk has "
                   "those of Chinese, Japanese and Korean");
    }
}

LoadedResult loadWithHash(const std::string& result, const std::string& meta, std::string& note) {
    LoadedResult loaded = loadResult(result, meta, note, Hash::Wanted);
    return loaded;
}

} // namespace

void addLabelOptions(CLI::App& program, LabelOptions& options) {
    const char* const group = "Labels and certificates of one result";
    program
        .add_option("--label", options.label,
                    "A label for the print, as the extension says:\n.pdf, .svg or .png")
        ->type_name("FILE")
        ->group(group);
    program
        .add_option("--label-size", options.sizeText,
                    "Width x height: 100x50mm, 62x100mm, 4x2in and so\n"
                    "on; 100x50mm without this")
        ->type_name("SIZE")
        ->group(group);
    program
        .add_option("--label-dpi", options.dpi,
                    "Dots per inch of a .png: the printer's, such as\n"
                    "203 or 300; 300 without this")
        ->type_name("NUMBER")
        ->check(CLI::Range(label::leastDpi, label::mostDpi))
        ->group(group);
    program.add_option("--pdf", options.certificate, "A certificate of one or two sheets, as PDF")
        ->type_name("FILE")
        ->group(group);
    program
        .add_option("--sheet", options.sheetText,
                    "Of the certificate: A4 or Letter; without this as\n"
                    "usual in the country of LC_PAPER")
        ->type_name("NAME")
        ->group(group);
    program.add_option("--operator", options.operatorName, "Who answers for the print")
        ->type_name("NAME")
        ->group(group);
    program
        .add_option("--label-field", options.fields,
                    "What neither result nor job states, or states\n"
                    "otherwise, such as paper=\"Proof paper 235\"; the\n"
                    "names are " +
                        std::string("calibrated, colourants, condition,\n"
                                    "instrument, intent, operator, paper, printer,\n"
                                    "profile, software and workflow"))
        ->type_name("NAME=TEXT")
        ->take_all()
        ->group(group);
    program
        .add_option("--match", options.match,
                    "Whether a label and the result belong together;\n"
                    "the text of its code, \"-\" is standard input")
        ->type_name("TEXT")
        ->group(group);
}

void settle(LabelOptions& options) {
    if (!options.label.empty()) {
        const auto format = label::formatOf(options.label);
        if (!format) {
            throw CLI::ValidationError("--label", "takes a name that ends in .pdf, .svg or .png");
        }
        options.format = *format;
    }
    if (!options.certificate.empty() &&
        label::formatOf(options.certificate) != label::Format::Pdf) {
        throw CLI::ValidationError("--pdf", "takes a name that ends in .pdf");
    }
    if (options.areDrawn() && options.label == options.certificate) {
        throw CLI::ValidationError("--label and --pdf", "take names of two files");
    }
    if (!options.sizeText.empty()) {
        const auto size = label::sizeOf(options.sizeText);
        if (!size) {
            throw CLI::ValidationError("--label-size", label::sizeRule);
        }
        options.size = *size;
    }
    options.sheet = label::usualSheet();
    if (!options.sheetText.empty()) {
        const auto sheet = label::sheetOf(options.sheetText);
        if (!sheet) {
            throw CLI::ValidationError("--sheet", "takes A4 or Letter");
        }
        options.sheet = *sheet;
    }
    for (const std::string& text : options.fields) {
        const std::size_t equals = text.find('=');
        const auto field = label::fieldOf(text.substr(0, equals));
        if (equals == text.npos || !field) {
            throw CLI::ValidationError("--label-field", "takes NAME=TEXT, and as a name one of " +
                                                            label::fieldNames());
        }
        options.details[*field] = text.substr(equals + 1);
    }
    if (!options.operatorName.empty()) {
        options.details[label::Field::Operator] = options.operatorName;
    }
    if (!options.match.empty() && options.areDrawn()) {
        throw CLI::ExcludesError("--match", "--label and --pdf");
    }
}

void writeLabels(const LabelOptions& options, const std::string& result, const std::string& meta,
                 std::optional<languages::Language> language,
                 const std::function<void(const std::string&)>& say) {
    std::string note;
    const LoadedResult loaded = loadWithHash(result, meta, note);
    if (!note.empty()) {
        say(note);
    }
    label::useLanguage(language ? *language : languageOf(loaded.metaOrNull()));
    const label::Subject subject = subjectOf(loaded, options.details);
    if (!options.label.empty()) {
        write(options.label, label::drawLabel(subject, options.size, options.format, options.dpi),
              say);
    }
    if (!options.certificate.empty()) {
        write(options.certificate, label::drawCertificate(subject, options.sheet), say);
    }
}

Status matchLabel(const LabelOptions& options, const std::string& result, const std::string& meta) {
    constexpr std::size_t mostBytes = 4096;
    const auto text =
        label::readCodeText(options.match == "-" ? standardInput(mostBytes) : options.match);
    if (!text) {
        writeOutput("-", "The text is not that of a label.\n");
        return Status::NoLabel;
    }
    std::string note;
    const LoadedResult loaded = loadWithHash(result, meta, note);
    switch (label::compareCodeText(*text, loaded.result, loaded.metaOrNull(), loaded.hash)) {
    case label::Match::Same:
        writeOutput("-", "The label belongs to this result.\n");
        return Status::Done;
    case label::Match::OtherResult:
        writeOutput("-", "The label belongs to another result, or the result was changed since: "
                         "its SHA-256 is " +
                             loaded.hash + ", the label's is " + text->hash + ".\n");
        return Status::OtherResult;
    case label::Match::Altered:
        break;
    }
    writeOutput("-", "The label names this result, but states another verdict, date, job or file: "
                     "its text was altered.\n");
    return Status::OtherResult;
}

} // namespace report
