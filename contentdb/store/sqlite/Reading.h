#pragma once

#include "contentdb/store/sqlite/Sqlite.h"

#include <memory>
#include <string>

namespace qvct::contentdb {

/// Opens a database to be read. If a run is making it, this waits up to ten seconds until something is in it;
/// if a rebuilt one was not yet put into its place, that is done first.
/// @throws DatabaseFailure, that of openDatabase, or: it is being made, and nothing is in it yet.
std::unique_ptr<Connection> openToRead(const std::string& path);

}  // namespace qvct::contentdb
