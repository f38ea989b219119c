// SPDX-License-Identifier: Apache-2.0
#include "report/Meta.h"

#include <stdexcept>

#include <nlohmann/json.hpp>

namespace report {
namespace {

using Json = nlohmann::json;

std::string text(const Json& value) {
    return value.is_null() ? "" : value.get<std::string>();
}

std::int64_t integer(const Json& value) {
    if (!value.is_number_integer()) {
        throw std::runtime_error("a number that is not whole");
    }
    return value.get<std::int64_t>();
}

/// The stamp becomes part of a file name, so only its exact form is accepted.
std::string stamp(const std::string& value) {
    constexpr std::string_view form = "0000-00-00T00:00:00+00:00";
    bool fits = value.size() == form.size();
    for (std::size_t i = 0; fits && i < form.size(); ++i) {
        fits = form[i] == '0'   ? value[i] >= '0' && value[i] <= '9'
               : form[i] == '+' ? value[i] == '+' || value[i] == '-'
                                : value[i] == form[i];
    }
    if (!fits) {
        throw std::runtime_error("\"created\" is no time");
    }
    return value;
}

} // namespace

std::optional<Meta> readMeta(std::string_view bytes, std::string& problem) {
    try {
        const Json json = Json::parse(bytes);
        if (!json.is_object() || json.value("format", Json()) != "tintgate-meta") {
            throw std::runtime_error("not a meta file");
        }
        if (json.at("formatVersion") != 1) {
            throw std::runtime_error("a format that this version does not know");
        }
        Meta meta;
        meta.created = stamp(json.at("created"));
        const Json& job = json.at("job");
        meta.jobId = integer(job.at("id"));
        if (!job.at("parentId").is_null()) {
            meta.parentId = integer(job.at("parentId"));
        }
        meta.title = text(job.at("title"));
        meta.strip = job.at("strip") == 2 ? 2 : 1;
        meta.instrument = text(json.at("instrument").at("name"));
        meta.paper = text(json.at("paper"));
        meta.workflow = text(json.at("workflow").at("name"));
        const Json& server = json.at("server");
        meta.server = text(server.at("name"));
        if (meta.server.empty()) {
            meta.server = text(server.at("host"));
        }
        meta.user = text(server.at("user"));
        meta.language = text(json.value("language", Json()));
        return meta;
    } catch (const std::exception& failure) {
        problem = failure.what();
        return std::nullopt;
    }
}

} // namespace report
