// SPDX-License-Identifier: Apache-2.0
#include "Browse.h"

#include <iterator>
#include <sstream>

#include <unistd.h>

namespace support {

namespace {

Outcome runBrowser(const ScratchFolder& scratch, const std::string& page,
                   const std::string& action) {
    std::istringstream words("chromium --headless --disable-gpu --disable-quic --no-first-run "
                             "--disable-background-networking --disable-component-update "
                             "--disable-sync --enable-logging=stderr --virtual-time-budget=5000");
    std::vector<std::string> command(std::istream_iterator<std::string>(words), {});
    if (geteuid() == 0) {
        command.emplace_back("--no-sandbox");
    }
    command.push_back(action);
    command.push_back("--user-data-dir=" + scratch.path("browser"));
    command.push_back("file://" + page);
    return run(command);
}

} // namespace

Outcome browse(const ScratchFolder& scratch, const std::string& page) {
    return runBrowser(scratch, page, "--dump-dom");
}

std::string printed(const ScratchFolder& scratch, const std::string& page) {
    const std::string sheets = scratch.path("sheets.pdf");
    runBrowser(scratch, page, "--print-to-pdf=" + sheets);
    return run({"pdftotext", "-layout", sheets, "-"}).output;
}

Outcome browseHandled(const ScratchFolder& scratch, const std::string& page,
                      const std::string& script) {
    std::string text = contentsOf(page);
    const std::size_t policy = text.find("<meta http-equiv=\"Content-Security-Policy\"");
    text.erase(policy, text.find('\n', policy) - policy);
    text.insert(text.rfind("</body>"), R"(<script>
        const seen = (name, text) => { document.body.append(`\n[${name}: ${text}]\n`); };
        const text = (id) => document.getElementById(id).textContent;
        const find = (words) => {
            document.getElementById("find").value = words;
            document.getElementById("find").dispatchEvent(new Event("input"));
        };
        )" + script + "</script>");
    return browse(scratch, scratch.write("handled.html", text));
}

} // namespace support
