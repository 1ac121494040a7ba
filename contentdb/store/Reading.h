#pragma once

#include "contentdb/store/Sqlite.h"

#include <memory>
#include <string>

namespace qvct::contentdb {

/// Opens a database to be read. One that a run is making is waited for until something is in it, ten seconds
/// at most; one whose rebuilding was interrupted is put into its place first.
/// @throws DatabaseFailure, that of openDatabase, or: it is being made, and nothing is in it yet.
std::unique_ptr<Connection> openToRead(const std::string& path);

}  // namespace qvct::contentdb
