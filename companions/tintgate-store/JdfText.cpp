// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/JdfText.h"

#include <algorithm>
#include <set>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/XmlMap.h"

namespace admin {

namespace {

// Texts that the update searches for.
constexpr std::string_view fullTag =
    "<tazo:MeasurementData ID=\"BJDFLink0000006\" Class=\"Parameter\" Status=\"Available\">";
constexpr std::string_view holderEnd = "</tazo:MeasurementData>";
constexpr std::string_view dateToken = "printdate=\"";
constexpr std::string_view timeToken = "printtime=\"";

constexpr std::string_view holderName = "tazo:MeasurementData";
constexpr std::string_view linkName = "tazo:MeasurementDataLink";
constexpr const char* parties[] = {"Sender", "Receiver"};

// The same tag reordered, and a namespace declaration for JDFs that have none.
constexpr const char* reorderedAttributes =
    " Class=\"Parameter\" ID=\"BJDFLink0000006\" Status=\"Available\">";
constexpr const char* namespaceDeclaration = " xmlns:tazo=\"urn:tazo\"";

constexpr std::size_t smallestJdf = 5000; // A smaller file is never updated.

/// Bytes lost by the dates: n updates of one party make them 10(2^n - 1) and 8(2^n - 1) bytes long.
std::size_t bytesLostIn(int updates) {
    const auto n = static_cast<std::size_t>(updates);
    return 36 * ((std::size_t{1} << n) - n - 1);
}

/// Only for the XML check: puts the missing blank between two spectral values in place of a letter
/// of the second one's name, so that no position changes.
std::string judged(std::string_view jdf) {
    constexpr std::string_view missing = "\"dvalue";
    std::string text(jdf);
    for (auto at = text.find(missing); at != std::string::npos; at = text.find(missing, at + 1)) {
        text[at + 1] = ' ';
    }
    return text;
}

std::size_t backOverBlanks(std::string_view text, std::size_t at) {
    while (at > 0 && (text[at - 1] == ' ' || text[at - 1] == '\t')) {
        --at;
    }
    return at;
}

[[noreturn]] void failMisled(std::string_view text, std::size_t at, const std::string& why) {
    const auto lines =
        std::count(text.begin(), text.begin() + static_cast<std::ptrdiff_t>(at), '\n');
    throw Failure(Status::JdfNotSound,
                  "line " + std::to_string(lines + 1) + " would mislead the update: " + why);
}

/// Changes to a text, at positions in the original.
class Edits {
  public:
    /// Of two changes at one position, the one added first comes first.
    void replace(std::size_t at, std::size_t count, std::string text) {
        m_edits.push_back({at, count, std::move(text)});
    }
    void insert(std::size_t at, std::string text) { replace(at, 0, std::move(text)); }

    std::string appliedTo(std::string_view text) {
        std::stable_sort(m_edits.begin(), m_edits.end(),
                         [](const Edit& a, const Edit& b) { return a.at < b.at; });
        std::string result;
        std::size_t done = 0;
        for (const Edit& edit : m_edits) {
            result.append(text, done, edit.at - done).append(edit.text);
            done = edit.at + edit.count;
        }
        return result.append(text, done);
    }

  private:
    struct Edit {
        std::size_t at, count;
        std::string text;
    };
    std::vector<Edit> m_edits;
};

class Preparation {
  public:
    /// With `declares`, our elements declare their prefix.
    Preparation(std::string_view text, const XmlMap& map, bool declares)
        : m_text(text), m_map(map), m_declaration(declares ? namespaceDeclaration : "") {}

    PreparedJdf run() {
        for (std::size_t i = 0; i < std::size(parties); ++i) {
            if (m_parties[i] != nullptr) {
                emptyDates(*m_parties[i]);
            }
            hideDatesOfOthers(parties[i], m_parties[i]);
        }
        tellHidden();
        ensureHolder();
        if (m_map.first(linkName) == nullptr) {
            addTo("ResourceLinkPool", "<tazo:MeasurementDataLink" + m_declaration +
                                          " rRef=\"BJDFLink0000006\" Usage=\"Input\"/>");
            m_changes.emplace_back("added the link to the element of measurements");
        }
        return {m_edits.appliedTo(m_text), std::move(m_changes)};
    }

  private:
    /// Puts the date and then the time, in the searched form, before everything that resembles
    /// them.
    void emptyDates(const XmlElement& party) {
        const auto attributes = m_map.attributesOf(party);
        const auto named = [&](std::string_view name) {
            const auto found =
                std::find_if(attributes.begin(), attributes.end(),
                             [&](const XmlAttribute& one) { return one.name == name; });
            return found == attributes.end() ? nullptr : &*found;
        };
        const XmlAttribute* const dates[] = {named("printdate"), named("printtime")};
        const auto isFound = [&](const XmlAttribute* attribute, std::string_view token,
                                 std::size_t from) {
            return attribute != nullptr && m_text.find(token, from) == attribute->nameBegin;
        };
        const bool inPlace = isFound(dates[0], dateToken, party.tag) &&
                             isFound(dates[1], timeToken, dates[0]->nameBegin);
        if (!inPlace) {
            m_edits.insert(party.tag + 1 + party.name.size(), " printdate=\"\" printtime=\"\"");
            m_changes.push_back("put empty dates into " + std::string(party.name));
        }
        for (const XmlAttribute* const date : dates) {
            if (date == nullptr) {
                continue;
            }
            const std::size_t begin = inPlace ? date->value : date->begin;
            m_edits.replace(begin, (inPlace ? date->valueEnd : date->end) - begin, "");
            if (date->valueEnd > date->value) {
                const auto value = m_text.substr(date->value, date->valueEnd - date->value);
                m_changes.push_back("emptied " + std::string(date->name) + " of " +
                                    std::string(party.name) + " (" +
                                    printable(value.substr(0, 40)) + ")");
            }
        }
    }

    /// The update starts at the first text of this kind, which may be in another element's name
    /// (<SenderInfo>) or in a comment, and uses the next date. A blank hides the dates of other
    /// elements from it.
    void hideDatesOfOthers(const std::string& party, const XmlElement* element) {
        const std::size_t from = m_text.find("<" + party);
        const std::size_t end = element == nullptr ? m_text.size() : element->tag;
        for (const std::string_view token : {dateToken, timeToken}) {
            std::size_t at = from;
            while ((at = m_text.find(token, at)) < end) {
                const auto* const around = m_map.withTagAround(at);
                if (around == nullptr || around->name.empty()) {
                    at += token.size();
                    continue;
                }
                if (std::find(std::begin(m_parties), std::end(m_parties), around) ==
                    std::end(m_parties)) {
                    hideIn(*around, token);
                }
                at = around->tagEnd;
            }
        }
    }

    void hideIn(const XmlElement& element, std::string_view token) {
        const std::string_view name = token.substr(0, token.find('='));
        for (const XmlAttribute& attribute : m_map.attributesOf(element)) {
            const std::size_t nameEnd = attribute.nameBegin + attribute.name.size();
            if (attribute.name.ends_with(name) &&
                m_text.substr(nameEnd).starts_with(token.substr(name.size())) &&
                m_hidden.insert(nameEnd).second) {
                m_edits.insert(nameEnd, " ");
            }
        }
    }

    void tellHidden() {
        if (m_hidden.empty()) {
            return;
        }
        const auto* const first = m_map.withTagAround(*m_hidden.begin());
        m_changes.push_back("put a blank after the name of " +
                            counted(std::ssize(m_hidden), "date") +
                            " of other elements, so that no update finds " +
                            (m_hidden.size() == 1 ? "it" : "them") + " (the first is in " +
                            std::string(first->name) + ")");
    }

    void ensureHolder() {
        const auto* const holder = m_map.first(holderName);
        if (holder == nullptr) {
            addTo("ResourcePool", "<tazo:MeasurementData" + m_declaration + reorderedAttributes +
                                      std::string(holderEnd));
            m_changes.emplace_back("added an empty element of measurements");
            return;
        }
        if (holder->hasEmptyTag()) {
            openHolder(*holder);
            m_changes.emplace_back("opened the element of measurements");
        } else if (!m_text.substr(holder->endTag).starts_with(holderEnd)) { // </tazo:... >
            m_edits.replace(holder->endTag, m_text.find('>', holder->endTag) + 1 - holder->endTag,
                            std::string(holderEnd));
            m_changes.emplace_back("took blanks out of the end tag of the element of measurements");
        }
        for (const XmlElement& element : m_map.elements()) {
            const auto tag = m_text.substr(element.tag, element.tagEnd - element.tag);
            if (element.name == holderName && tag == fullTag) {
                m_edits.replace(element.tag, fullTag.size(),
                                "<tazo:MeasurementData" + std::string(reorderedAttributes));
                m_changes.emplace_back("reordered the attributes of the element of measurements");
            }
        }
    }

    /// Appends to a pool of the root element, and adds the pool if it is missing.
    void addTo(const std::string& poolName, const std::string& text) {
        const XmlElement& root = m_map.elements().front();
        const std::size_t prefix = root.name.find(':') + 1; // 0 without a prefix.
        const std::string name = std::string(root.name.substr(0, prefix)) + poolName;
        const auto* const pool = m_map.first(name, &root);
        if (pool != nullptr && pool->hasEmptyTag()) {
            open(*pool, text);
        } else if (pool != nullptr) {
            m_edits.insert(backOverBlanks(m_text, pool->endTag), text + "\n");
        } else if (!root.hasEmptyTag()) {
            m_edits.insert(backOverBlanks(m_text, root.endTag),
                           "<" + name + ">" + text + "</" + name + ">\n");
        } else {
            failMisled(m_text, root.tag, "there is nothing in the document");
        }
    }

    /// Replaces an empty tag by a start tag and an end tag.
    void open(const XmlElement& element, const std::string& inside) {
        m_edits.replace(element.tagEnd - 2, 2,
                        ">" + inside + "</" + std::string(element.name) + ">");
    }

    /// The update's own tag is reordered, because its search must not find it.
    void openHolder(const XmlElement& holder) {
        const auto tag = m_text.substr(holder.tag, holder.tagEnd - holder.tag - 2);
        if (tag == fullTag.substr(0, fullTag.size() - 1)) {
            m_edits.replace(holder.tag, holder.tagEnd - holder.tag,
                            "<tazo:MeasurementData" + std::string(reorderedAttributes) +
                                std::string(holderEnd));
        } else {
            open(holder, "");
        }
    }

    const std::string_view m_text;
    const XmlMap& m_map;
    const std::string m_declaration;
    const XmlElement* const m_parties[2] = {m_map.first(parties[0]), m_map.first(parties[1])};
    std::set<std::size_t> m_hidden; ///< Ends of attribute names.
    Edits m_edits;
    std::vector<std::string> m_changes;
};

/// Searches like the update and throws if it would fail: its tokens may also occur in a comment,
/// for example, or in the name of another element.
void checkSearches(std::string_view text, const XmlMap& map) {
    const std::size_t end = text.find(holderEnd);
    if (end != map.first(holderName)->endTag) {
        failMisled(text, end, "</tazo:MeasurementData> is no tag there");
    }
    if (const auto tag = text.find(fullTag); tag != std::string_view::npos) {
        failMisled(text, tag, "the text contains the update's own opening tag");
    }
    for (const std::string party : parties) {
        const auto* const element = map.first(party);
        const auto attributes =
            element == nullptr ? std::vector<XmlAttribute>() : map.attributesOf(*element);
        std::size_t from = text.find("<" + party);
        for (const std::string_view token : {dateToken, timeToken}) {
            const std::size_t at = text.find(token, from);
            if (from == std::string_view::npos || at == std::string_view::npos) {
                continue;
            }
            const bool isOwn = std::any_of(
                attributes.begin(), attributes.end(), [&](const XmlAttribute& attribute) {
                    return attribute.nameBegin == at &&
                           attribute.name == token.substr(0, token.find('='));
                });
            if (!isOwn) {
                failMisled(text, at, "there is a date that is not the " + party + "'s");
            }
            from = at;
        }
    }
}

/// Adds as many blanks after the text as the updates take. 5,000 bytes must precede the blanks.
void addBlanks(PreparedJdf& jdf, int updates) {
    const std::size_t size = jdf.text.find_last_not_of(' ') + 1;
    const std::size_t wanted = bytesLostIn(updates) + smallestJdf - std::min(size, smallestJdf);
    const std::size_t there = jdf.text.size() - size;
    if (there < wanted) {
        jdf.text.append(wanted - there, ' ');
        jdf.changes.push_back("added " + std::to_string(wanted - there) + " blanks at the end");
    }
}

void checkLimits(std::size_t size, int updates) {
    if (updates > mostUpdates) {
        throw Failure(Status::JdfTooLarge,
                      "the blanks for " + std::to_string(updates) +
                          " updates are too many: they double with each, and the most is " +
                          std::to_string(mostUpdates));
    }
    if (size + bytesLostIn(updates) > largestJdf) {
        throw Failure(Status::JdfTooLarge, "a JDF has at most 256 MiB");
    }
}

void checkCount(const XmlMap& map) {
    if (map.hasTooManyElements()) {
        throw Failure(Status::JdfTooLarge, "it has " + map.fault());
    }
}

/// Whether the text uses more than one byte per character.
bool isWide(std::string_view text) {
    return text.find('\0') != std::string_view::npos;
}

bool isWellFormedElement(std::string_view element) {
    return XmlMap("<x xmlns:tazo=\"x\">" + judged(element) + "</x>").fault().empty();
}

} // namespace

bool isSound(std::string_view jdf) {
    return jdf.size() <= largestJdf && !isWide(jdf) && XmlMap(judged(jdf)).fault().empty();
}

PreparedJdf prepared(const std::string& jdf, int updates) {
    checkLimits(jdf.size(), updates);
    if (isWide(jdf)) {
        throw Failure(
            Status::JdfNotSound,
            "it is UTF-16, but the update finds its tokens only in UTF-8 and similar encodings");
    }
    const std::string text = judged(jdf);
    const XmlMap map(text);
    std::string fault = map.fault();
    checkCount(map);
    if (!fault.empty()) {
        throw Failure(Status::JdfNotSound, "it is not well-formed, " + fault);
    }
    for (const bool declares : {false, true}) {
        PreparedJdf result = Preparation(jdf, map, declares).run();
        const std::string after = judged(result.text);
        const XmlMap mapAfter(after);
        checkCount(mapAfter);
        fault = mapAfter.fault();
        if (fault.empty()) {
            checkSearches(result.text, mapAfter);
            addBlanks(result, updates);
            return result;
        }
    }
    throw Failure(Status::JdfNotSound, "it would not be well-formed with measurements, " + fault);
}

std::string unchangedPart(std::string_view prepared) {
    const std::string text = judged(prepared);
    const XmlMap map(text);
    std::string part;
    std::size_t done = 0;
    for (const XmlElement& element : map.elements()) {
        if ((element.name == holderName || element.name == linkName) && element.tag >= done) {
            part.append(text, done, element.tag - done);
            done = element.hasEmptyTag() ? element.tagEnd : text.find('>', element.endTag) + 1;
        }
    }
    part.append(text, done);
    std::erase_if(
        part, [](char c) { return std::string_view(" \t\r\n").find(c) != std::string_view::npos; });
    for (const std::string_view token : {dateToken, timeToken}) {
        std::string dateless;
        std::size_t from = 0;
        for (auto at = part.find(token); at != std::string::npos; at = part.find(token, from)) {
            dateless.append(part, from, at + token.size() - from);
            from = std::min(part.find('"', at + token.size()), part.size());
        }
        part = dateless.append(part, from);
    }
    return part;
}

std::vector<std::string> measurementsIn(std::string_view jdf) {
    std::vector<std::pair<std::size_t, std::string>> found;
    for (const std::string name : {"tazo:Measurement", "tazo:Measurement2"}) {
        const std::string opening = "<" + name + " ";
        const std::string closing = "</" + name + ">";
        std::size_t done = 0;
        for (auto end = jdf.find(closing); end != std::string_view::npos;
             end = jdf.find(closing, done)) {
            const std::size_t start = jdf.substr(done, end - done).rfind(opening);
            const std::size_t behind = end + closing.size();
            if (start != std::string_view::npos) {
                const auto element = jdf.substr(done + start, behind - done - start);
                if (isWellFormedElement(element)) {
                    found.emplace_back(done + start, element);
                }
            }
            done = behind;
        }
    }
    std::sort(found.begin(), found.end());
    std::vector<std::string> measurements;
    for (auto& [place, text] : found) {
        measurements.push_back(std::move(text));
    }
    return measurements;
}

std::string withMeasurements(std::string jdf, const std::vector<std::string>& measurements) {
    std::string all;
    for (const std::string& measurement : measurements) {
        all += measurement + "\n";
    }
    if (jdf.size() + all.size() > largestJdf) {
        throw Failure(Status::JdfTooLarge, "with all measurements it would have more than 256 MiB");
    }
    return jdf.insert(backOverBlanks(jdf, jdf.find(holderEnd)), all);
}

} // namespace admin
