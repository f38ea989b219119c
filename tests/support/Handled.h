// Pages as they are when a person has used them.
#pragma once

#include <string>

#include "Browse.h"
#include "ScratchFolder.h"

/// Shows a page with a script at its end for a person's hand, which the page's policy has to let in
/// for once. The script notes what it sees: seen("name", "text") adds "[name: text]" to the page.
inline support::Outcome browseHandled(const support::ScratchFolder& scratch,
                                      const std::string& path, const std::string& script) {
    std::string page = support::contentsOf(path);
    const std::size_t policy = page.find("<meta http-equiv=\"Content-Security-Policy\"");
    page.erase(policy, page.find('\n', policy) - policy);
    page.insert(page.rfind("</body>"), R"(<script>
        const seen = (name, text) => { document.body.append(`\n[${name}: ${text}]\n`); };
        const text = (id) => document.getElementById(id).textContent;
        const find = (words) => {
            document.getElementById("find").value = words;
            document.getElementById("find").dispatchEvent(new Event("input"));
        };
        )" + script + "</script>");
    return support::browse(scratch.write("handled.html", page), scratch.path("browser"));
}
