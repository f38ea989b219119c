// SPDX-License-Identifier: Apache-2.0
#include "report/label/Symbol.h"

#include <memory>

#include <qrencode.h>

namespace label {

std::optional<Symbol> symbolOf(const std::string& text, Correction correction) {
    constexpr int smallestVersion = 0;
    constexpr int caseSensitive = 1;
    const std::unique_ptr<QRcode, void (*)(QRcode*)> code(
        QRcode_encodeString(text.c_str(), smallestVersion,
                            correction == Correction::Low ? QR_ECLEVEL_L : QR_ECLEVEL_M, QR_MODE_8,
                            caseSensitive),
        QRcode_free);
    if (!code) {
        return std::nullopt;
    }
    Symbol symbol;
    symbol.side = static_cast<std::size_t>(code->width);
    symbol.dark.reserve(symbol.side * symbol.side);
    for (std::size_t i = 0; i < symbol.side * symbol.side; ++i) {
        symbol.dark.push_back((code->data[i] & 1) != 0);
    }
    return symbol;
}

} // namespace label
