// SPDX-License-Identifier: Apache-2.0
// The files of a store in a PostgreSQL database. They are available to every machine that reaches
// the server. A delivery is one transaction, so an interrupted one leaves nothing.
#pragma once

#include <optional>
#include <string_view>

#include "store/postgres/Postgres.h"

namespace store::postgres {

/// See StoreEngine for each of these. The connection must outlive this object.
class Files {
  public:
    explicit Files(Connection& connection) : m_connection(connection) {}

    void put(std::string_view path, std::istream& from);
    void get(std::string_view path, std::ostream& to);
    std::vector<FileEntry> list();
    std::optional<FileEntry> at(std::string_view path);
    std::vector<FileVersion> versions(std::string_view path);
    void getVersion(std::string_view path, int number, std::ostream& to);
    void restoreVersion(std::string_view path, int number);
    int pruneVersions(std::string_view path, const Pruning& which);
    bool remove(std::string_view path, std::optional<int> highestVersion);
    void placeVersion(std::string_view path, const FileVersion& version, std::istream& from);
    int highestVersion(std::string_view path);
    void raiseHighestVersion(std::string_view path, int number);

  private:
    Connection& m_connection;
};

} // namespace store::postgres
