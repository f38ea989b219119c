// SPDX-License-Identifier: Apache-2.0
#include "report/Template.h"

#include "report/Html.h"

namespace report {

std::string assembled(std::span<const Piece> pieces, const languages::Texts& say,
                      const std::function<void(std::string_view hole, std::string& page)>& fill) {
    constexpr std::string_view text = "text ";
    std::string page;
    for (const auto& [piece, hole] : pieces) {
        page += piece;
        if (hole == "lang") {
            page += languages::tagOf(say.language());
        } else if (hole.starts_with(text)) {
            page += Html(say.find(hole.substr(text.size())).value_or("")).markup();
        } else if (!hole.empty()) {
            fill(hole, page);
        }
    }
    return page;
}

} // namespace report
