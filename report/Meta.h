// SPDX-License-Identifier: Apache-2.0
// Data of a job other than its colours, read from its JSON (docs/meta.schema.json).
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace report {

/// Texts are empty if unknown.
struct Meta {
    std::string created; ///< Local time: 2024-05-01T12:34:56+02:00.
    std::int64_t jobId = 0;
    std::optional<std::int64_t> parentId;
    std::string title;
    int strip = 1;
    std::string instrument;
    std::string paper;
    std::string workflow;
    std::string server;
    std::string user;
    std::string language; ///< As the job's client named it, such as "de_DE".
};

/// Nothing if the text is not a meta file in a known format; `problem` then describes why.
std::optional<Meta> readMeta(std::string_view json, std::string& problem);

} // namespace report
