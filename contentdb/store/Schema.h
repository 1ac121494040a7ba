#pragma once

#include "contentdb/store/Sqlite.h"

#include <memory>
#include <optional>
#include <string>

namespace qvct::contentdb {

enum class Access { read, write };

/// Opens a content database, making it (for `Access::write`) where there is none, and brings an older one to
/// the present form. Refuses a file that is something else, damaged, or made by a newer version.
/// @throws DatabaseFailure: kErrorMalformed when it is a content database that is damaged.
std::unique_ptr<Connection> openDatabase(const std::string& path, Access access);

/// Why what lies at the path cannot be a database, found without opening it: a folder, a pipe, a device.
std::optional<std::string> reasonAgainstDatabase(const std::string& path);

}  // namespace qvct::contentdb
