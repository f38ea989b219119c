// SPDX-License-Identifier: Apache-2.0
#include "report/Page.h"

#include <cmath>

#include "base/Utf8.h"
#include "report/InPage.h"
#include "report/Template.h"

namespace report {
namespace {

using Json = PageJson;

constexpr std::string_view summaryStart = R"(<script type="application/json" id="summary">)";
constexpr std::size_t longestText = 500; ///< Of a text in a summary, in bytes.

/// Measured less target, without the noise that a subtraction adds behind the sixth decimal.
double less(double measured, double target) {
    return std::round((measured - target) * 1e6) / 1e6;
}

/// Rows are the bulk of a page, so they are written without a tree:
/// [index, id, name, [device], [target Lab], [measured Lab], [measured less target], difference,
///  target swatch, measured swatch, measured id, measured name]; a swatch is "#rrggbb", with "!"
/// after it if it is clipped. The last two are left out if they are the id and name.
void appendRow(std::string& text, const Result& result, const Row& row) {
    const Patch& patch = result.patches[row.patch];
    const auto list = [&](std::initializer_list<double> values) {
        char separator = '[';
        for (const double value : values) {
            text += separator;
            appendNumber(text, value);
            separator = ',';
        }
        text += "],";
    };
    text += '[' + std::to_string(row.patch) + ',' + inScript(patch.id) + ',' +
            inScript(patch.name) + ",[";
    const std::size_t channels = result.channels.size();
    for (std::size_t i = 0; i < channels; ++i) {
        if (i != 0) {
            text += ',';
        }
        appendNumber(text, result.device[row.patch * channels + i]);
    }
    text += "],";
    list({patch.target.L, patch.target.a, patch.target.b});
    list({patch.measured.L, patch.measured.a, patch.measured.b});
    list({less(patch.measured.L, patch.target.L), less(patch.measured.a, patch.target.a),
          less(patch.measured.b, patch.target.b)});
    appendNumber(text, patch.difference);
    text += ',';
    text += '"' + swatchText(row.target) + "\",\"" + swatchText(row.measured) + '"';
    if (patch.measuredId != patch.id || patch.measuredName != patch.name) {
        text += ',' + inScript(patch.measuredId) + ',' + inScript(patch.measuredName);
    }
    text += ']';
}

Json figures(const std::vector<Figure>& figures) {
    Json list = Json::array();
    for (const Figure& figure : figures) {
        list.push_back({{"title", figure.title},
                        {"unit", figure.unit},
                        {"outcome", keyOf(figure.outcome)},
                        {"word", figure.word},
                        {"value", figure.value},
                        {"tolerance", figure.tolerance},
                        {"distance", figure.distance},
                        {"fill", figure.fill},
                        {"patches", figure.patches},
                        {"worst", figure.worstLabel}});
    }
    return list;
}

Json facts(const Facts& facts) {
    Json list = Json::array();
    for (const auto& [label, text] : facts) {
        list.push_back({label, text});
    }
    return list;
}

Json bins(const std::vector<Bin>& histogram) {
    Json list = Json::array();
    for (const Bin& bin : histogram) {
        list.push_back({bin.from, bin.to, bin.count});
    }
    return list;
}

Json marks(const std::vector<Mark>& marks) {
    Json list = Json::array();
    for (const Mark& mark : marks) {
        list.push_back({{"label", mark.label}, {"value", mark.value}, {"limit", mark.limit}});
    }
    return list;
}

Json sections(const Model& model) {
    Json list = Json::array();
    for (const auto& [title, content] : model.sections) {
        list.push_back({title, facts(content)});
    }
    return list;
}

std::string dataOf(const Model& model, const Result& result) {
    const Json head = {{"title", model.title},
                       {"subtitle", model.subtitle},
                       {"verdict", keyOf(model.verdict)},
                       {"word", model.word},
                       {"sentence", model.sentence},
                       {"doubts", model.doubts},
                       {"reasons", model.reasons},
                       {"condition", model.condition},
                       {"unit", model.unit},
                       {"judged", figures(model.judged)},
                       {"others", figures(model.others)},
                       {"statistics", facts(model.statistics)},
                       {"warnings", model.warnings},
                       {"histogram", bins(model.histogram)},
                       {"marks", marks(model.marks)},
                       {"histogramText", model.histogramText},
                       {"drawn", model.drawn},
                       {"drawnText", model.drawnText},
                       {"sections", sections(model)},
                       {"channels", result.channels}};
    std::string text = inScript(head);
    text.back() = ',';
    text += "\"rows\":[";
    for (std::size_t i = 0; i < model.rows.size(); ++i) {
        text += i == 0 ? "\n" : ",\n";
        appendRow(text, result, model.rows[i]);
    }
    return text += "]}";
}

/// The text, cut to what a summary has room for, never within a character.
std::string shortened(std::string text) {
    if (text.size() <= longestText) {
        return text;
    }
    return std::string(base::cutUtf8(text, longestText)) + "…";
}

Json summaryJson(const Summary& summary) {
    return {{"verdict", keyOf(summary.verdict)},       {"word", summary.word},
            {"sentence", shortened(summary.sentence)}, {"title", shortened(summary.title)},
            {"subtitle", shortened(summary.subtitle)}, {"created", summary.created}};
}

} // namespace

std::string pageOf(const Result& result, const Meta* meta) {
    const Model model = makeModel(result, meta);
    const Summary summary{model.verdict, model.word,     model.sentence,
                          model.title,   model.subtitle, meta != nullptr ? meta->created : ""};
    std::string page(pageTemplate[0]);
    page += inScript(summaryJson(summary));
    page += pageTemplate[1];
    page += dataOf(model, result);
    return page += pageTemplate[2];
}

std::optional<Summary> summaryIn(std::string_view page) {
    const std::size_t start = page.find(summaryStart);
    if (start == page.npos) {
        return std::nullopt;
    }
    page.remove_prefix(start + summaryStart.size());
    const Json json = Json::parse(page.substr(0, page.find('<')), nullptr, false);
    try {
        const std::string verdict = json.at("verdict");
        Summary summary;
        summary.verdict = verdict == "passed"   ? Verdict::Passed
                          : verdict == "failed" ? Verdict::Failed
                                                : Verdict::Incomplete;
        summary.word = json.at("word");
        summary.sentence = json.at("sentence");
        summary.title = json.at("title");
        summary.subtitle = json.at("subtitle");
        summary.created = json.at("created");
        return summary;
    } catch (const Json::exception&) {
        return std::nullopt;
    }
}

std::string indexOf(const std::vector<Listed>& reports, const std::string& folder) {
    Json list = Json::array();
    for (const Listed& report : reports) {
        list.push_back(summaryJson(report.summary));
        list.back()["link"] = linkTo(report.path);
    }
    std::string page(indexTemplate[0]);
    page += inScript({{"folder", folder}, {"reports", list}});
    return page += indexTemplate[1];
}

} // namespace report
