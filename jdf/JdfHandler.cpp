// SPDX-License-Identifier: Apache-2.0
#include "jdf/JdfHandler.h"

#include <cstring>
#include <string>

#include <wx/datetime.h>

#include "jdf/JdfBuffer.h"
#include "jdf/JdfFile.h"

namespace {

constexpr long smallestFile = 5000; // A smaller file counts as missing (C81).
constexpr int mostPatches = 1'000'000;
constexpr long roomForAll = 2048;
constexpr long roomForPatch = 200 + 700; // Colour values and spectral values.

constexpr char linkElement[] =
    "<tazo:MeasurementDataLink rRef=\"BJDFLink0000006\" Usage=\"Input\"/>\n";
constexpr char openingTag[] =
    "<tazo:MeasurementData ID=\"BJDFLink0000006\" Class=\"Parameter\" Status=\"Available\">";
constexpr char closingTag[] = "</tazo:MeasurementData>";
constexpr char linkPoolEnd[] = "</ResourceLinkPool>";
constexpr char poolEnd[] = "</ResourcePool>";

template<std::size_t N>
void store(char (&field)[N], const wxString& text) {
    std::strncpy(field, text.mb_str(), N - 1);
    field[N - 1] = '\0';
}

/// One update: the contents, the position of the last search, and the latest failure.
class Update {
  public:
    explicit Update(jdf::Contents contents)
        : m_contents(std::move(contents)), m_position(m_contents.start) {}

    /// Stamps date and time into the first element of this name. The search for the attributes is
    /// not bounded by the element's end (C75).
    void stamp(const char* element, const std::string& date, const std::string& time) {
        if (find(element)) {
            stampAttribute("printdate=\"", date);
            stampAttribute("printtime=\"", time);
        }
    }

    /// Ensures that the pool of resource links ends with the link to our resource.
    void ensureLink() {
        if (m_error != jdf::Done || find("<tazo:MeasurementDataLink")) {
            return;
        }
        if (!find(linkPoolEnd)) {
            m_error = jdf::NoResourceLinks;
            return;
        }
        skipBack();
        insert(linkElement);
    }

    /// Deletes from a tag of our resource, complete or not, to the end of its pool.
    void deleteResource(const char* tag) {
        if (!find(tag)) {
            return;
        }
        char* const from = m_position;
        if (findFrom(from + std::strlen(tag), poolEnd)) {
            check(DeleteCharactersFromBuffer(m_position - from, from, m_contents.start,
                                             m_contents.limit, &m_contents.length));
        }
    }

    /// Ensures that our resource exists, and moves to its closing tag.
    void ensureResource() {
        if (m_error != jdf::Done) {
            return;
        }
        SkipToNextLine(m_position, m_contents.end(), &m_position);
        if (find(closingTag)) {
            return;
        }
        deleteResource("<tazo:MeasurementData ID=");
        if (!find(poolEnd)) {
            m_error = jdf::NoResources;
            return;
        }
        skipBack();
        insert((std::string(openingTag) + closingTag + "\n").c_str());
        findFrom(m_position, closingTag);
    }

    /// The position after the resource's existing content. After a failure, the position of the
    /// last search: the start of the contents if it found nothing.
    char* insertionPoint(bool isSecondStrip) {
        skipBack();
        if (isSecondStrip && m_error == jdf::Done) {
            findFrom(m_position, closingTag);
            skipBack();
        }
        return m_position;
    }

    jdf::Contents& contents() { return m_contents; }

  private:
    bool find(const char* token) { return findFrom(m_contents.start, token); }

    /// Moves to the token. If it is not found, moves to `from`.
    bool findFrom(char* from, const char* token) {
        long length = 0;
        FindToken(token, from, m_contents.end(), &m_position, &length);
        return length != 0;
    }

    void skipBack() { SkipWhiteSpacesToStartOfLine(m_position, &m_position); }

    void insert(const char* text) { insertAt(m_position, text); }

    void insertAt(char* at, const char* text) {
        check(InsertCStringIntoBuffer(text, at, m_contents.start, m_contents.limit,
                                      &m_contents.length));
    }

    /// Inserts a text before an attribute's value. The value is first deleted, which duplicates it
    /// instead (see JdfBuffer.h). Moves to the attribute.
    void stampAttribute(const char* attribute, const std::string& text) {
        if (!findFrom(m_position, attribute)) {
            return;
        }
        char* const value = m_position + std::strlen(attribute);
        char* quote = nullptr;
        long length = 0;
        FindToken("\"", value, m_contents.end(), &quote, &length);
        if (length != 0) {
            check(DeleteCharactersFromBuffer(quote - value, value, m_contents.start,
                                             m_contents.limit, &m_contents.length));
        }
        insertAt(value, text.c_str());
    }

    /// A success does not clear an earlier failure.
    void check(int code) {
        if (code != jdf::Done) {
            m_error = code;
        }
    }

    jdf::Contents m_contents;
    char* m_position;
    int m_error = jdf::Done;
};

} // namespace

void JdfHandler::SetJDFMeasurementHeaderDefaults(JDFMeasurementHeader* header) {
    store(header->printDate, wxDateTime::Now().FormatISODate());
    store(header->printTime, wxDateTime::Now().FormatISOTime());
    header->measureDate[0] = '\0';
    header->measureTime[0] = '\0';
    store(header->deltaEType, "CMC");
    store(header->cmmVersion, "1.1.2.3");
    header->party = 0;
    header->approval = false;
    header->totalPass = false;
    header->paperWhitePass = false;
    header->maxTolerance = 0;
    header->maxDeltaE = 0;
    header->averageTolerance = 0;
    header->averageDeltaE = 0;
    header->writePatchDefinitions = false;
    header->profileName[0] = '\0';
}

int JdfHandler::AppendJDFFileData(KZJobDataStruct job, wxString comment,
                                  JDFMeasurementHeader* header, bool replace) {
    const int patches = job.measurement.numPatches;
    if (patches <= 0) {
        return jdf::NoPatches;
    }
    if (patches > mostPatches) {
        return jdf::NoFile;
    }
    const std::string path = wstringToString(job.jdfLocalFile.ToStdWstring());
    jdf::Contents contents = jdf::readFile(path, smallestFile, roomForAll + patches * roomForPatch);
    if (contents.block == nullptr) {
        return jdf::NoFile;
    }

    Update update(std::move(contents));
    const auto text = [](const char(&field)[16]) { return std::string(field, strnlen(field, 16)); };
    if (header->party == 1 || header->party == 2) {
        update.stamp(header->party == 1 ? "<Sender" : "<Receiver", text(header->printDate),
                     text(header->printTime));
    }
    update.ensureLink();
    if (replace) {
        update.deleteResource(openingTag);
    }
    update.ensureResource();
    char* const at = update.insertionPoint(job.secondStrip == 1);

    // Only the result of this step counts: after -13 and -14, the measurement and the file are
    // still written (C74).
    jdf::Contents& all = update.contents();
    const int code = WriteJDFMeasureData(at, all.start, all.limit, &all.length, job.measurement,
                                         header, comment);
    if (code != jdf::Done) {
        return code;
    }
    return jdf::replaceFile(path, all) ? jdf::Done : jdf::NoFile;
}
