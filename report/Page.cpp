// SPDX-License-Identifier: Apache-2.0
#include "report/Page.h"

#include <cmath>

#include "base/Utf8.h"
#include "report/Body.h"
#include "report/InPage.h"
#include "report/Template.h"

namespace report {
namespace {

using languages::Texts;
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

Json finite(double value) {
    return std::isfinite(value) ? Json(value) : Json();
}

/// [[title, text, [[nominal, measured, aim, tolerance, above], ...]], ...]
Json tones(const std::vector<ToneChart>& charts) {
    Json list = Json::array();
    for (const ToneChart& chart : charts) {
        Json points = Json::array();
        for (const TonePoint& p : chart.points) {
            points.push_back({finite(p.nominal), finite(p.measured), finite(p.aim),
                              finite(p.tolerance), p.above});
        }
        list.push_back({chart.title, chart.text, points});
    }
    return list;
}

/// Null for a result that says nothing of these.
Json measures(const Model& model, const Texts& say) {
    if (!model.papers) {
        return nullptr;
    }
    const PaperPair& papers = *model.papers;
    Json greys = Json::array();
    for (const Grey& grey : model.greys) {
        greys.push_back({finite(grey.tone), finite(grey.measured.a), finite(grey.measured.b),
                         finite(grey.aimA), finite(grey.aimB)});
    }
    Json spreads = Json::array();
    for (const SpreadBar& bar : model.spreads) {
        spreads.push_back({bar.label, finite(bar.mean), finite(bar.largest)});
    }
    return {{"aims", papers.sentence},
            {"papers",
             {{say("measure.targetPaper"), papers.target, swatchText(papers.targetSwatch)},
              {say("measure.measuredPaper"), papers.measured, swatchText(papers.measuredSwatch)}}},
            {"paperDifference", papers.difference},
            {"tones", tones(model.tones)},
            {"greys", greys},
            {"spreads", spreads},
            {"spreadsText", model.spreadsText}};
}

std::string dataOf(const Model& model, const Result& result, const Texts& say) {
    const Json head = {{"unit", model.unit},
                       {"all", result.patches.size()},
                       {"shown", model.shown},
                       {"shownText", model.shownText},
                       {"histogram", bins(model.histogram)},
                       {"marks", marks(model.marks)},
                       {"histogramText", model.histogramText},
                       {"drawn", model.drawn},
                       {"drawnText", model.drawnText},
                       {"measures", measures(model, say)},
                       {"channels", result.channels}};
    std::string text = inScript(head);
    text.back() = ',';
    text += "\"texts\":" + scriptTexts(say, "page") + ",\"rows\":[";
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
    return {{"verdict", keyOf(summary.verdict)},
            {"word", summary.word},
            {"sentence", shortened(summary.sentence)},
            {"title", shortened(summary.title)},
            {"subtitle", shortened(summary.subtitle)},
            {"created", summary.created},
            {"language", summary.language}};
}

} // namespace

languages::Language languageOf(const Meta* meta) {
    const auto ofJob = meta != nullptr ? languages::languageNamed(meta->language) : std::nullopt;
    return ofJob ? *ofJob : languages::languageOfUser();
}

std::string pageOf(const Result& result, const Meta* meta, const Texts& say, const Facts& print) {
    const Model model = makeModel(result, meta, say, print);
    const Summary summary{model.verdict,
                          model.word,
                          model.sentence,
                          model.title,
                          model.subtitle,
                          meta != nullptr ? meta->created : "",
                          std::string(languages::tagOf(say.language()))};
    return assembled(pageTemplate, say, [&](std::string_view hole, std::string& page) {
        if (hole == "summary") {
            page += inScript(summaryJson(summary));
        } else if (hole == "data") {
            page += dataOf(model, result, say);
        } else {
            page += bodyPart(hole, model, say).markup();
        }
    });
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
        summary.language = json.value("language", "en"); // Pages of older versions are English.
        return summary;
    } catch (const Json::exception&) {
        return std::nullopt;
    }
}

std::string indexOf(const std::vector<Listed>& reports, const std::string& folder,
                    const Texts& say) {
    Html rows;
    for (const auto& [path, summary] : reports) {
        const Html title = element("a", {{"href", linkTo(path)}}, Html(summary.title));
        const Html what = element("div", {{"class", "name"}}, Html(summary.subtitle)) +
                          element("div", summary.sentence);
        rows += element("tr", {{"class", keyOf(summary.verdict)}},
                        element("td", {}, badge(summary.verdict, wordOf(summary.verdict, say))) +
                            element("td", {{"lang", summary.language}}, title + what));
    }
    const Html heads = element("th", {{"scope", "col"}}, Html(say("html.page.verdict"))) +
                       element("th", {{"scope", "col"}}, Html(say("html.index.report")));
    const Html table =
        element("table", {{"id", "reports"}},
                element("thead", {}, element("tr", {}, heads)) + element("tbody", {}, rows));
    return assembled(indexTemplate, say, [&](std::string_view hole, std::string& page) {
        if (hole == "found") {
            page += Html(reports.empty()
                             ? say("index.none", {{"folder", folder}})
                             : say("index.found", {{"count", reports.size()}, {"folder", folder}}))
                        .markup();
        } else if (!reports.empty()) {
            page += element("section", {}, table).markup();
        }
    });
}

} // namespace report
