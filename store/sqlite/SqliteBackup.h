// SPDX-License-Identifier: Apache-2.0
// A backup of a store in a folder, while others are at work in it:
//
//   backup/
//     tickets.db.part   becomes tickets.db in the last step, which makes a store of the folder
//     files/
#pragma once

#include <string>

#include "store/sqlite/ServerFiles.h"
#include "store/sqlite/Sqlite.h"

namespace store::sqlite {

/// See StoreEngine::backUp. The database is that of the store's folder.
///
/// Database and files are of one moment: writers of both are kept out while the names of the files
/// are read and the database's state is fixed. A file that is replaced afterwards is still there,
/// as a version.
void backUp(Database& database, ServerFiles& files, const std::string& storeFolder,
            const std::string& folder, const StoreEngine::ShowProgress& progress);

} // namespace store::sqlite
