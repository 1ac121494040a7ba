#pragma once

#include "contentdb/store/sqlite/Sqlite.h"

#include <memory>
#include <optional>
#include <string>

namespace qvct::contentdb {

enum class Access { read, write };

/// Opens a content database. With `Access::write` a missing one is made and an older one is brought to the
/// present form; with `Access::read` both are refused. So is a file that is something else, damaged, or made
/// by a newer version.
/// @throws DatabaseFailure: kErrorMalformed when it is a content database that is damaged.
std::unique_ptr<Connection> openDatabase(const std::string& path, Access access);

/// Why what lies at the path cannot be a database, found without opening it: a folder, a pipe, a device.
std::optional<std::string> reasonAgainstDatabase(const std::string& path);

}  // namespace qvct::contentdb
