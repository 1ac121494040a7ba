#pragma once

#include "contentdb/ContentDatabase.h"

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace qvct::tool {

class ToolContext;

/// The database at the path, with a note while it is being indexed. Null, after a message, when it cannot be
/// read.
std::unique_ptr<contentdb::ContentDatabase> openDatabase(const std::string& path, ToolContext& context);

/// The query; nothing, after a message that points at the fault.
std::optional<contentdb::Query> queryIn(const std::string& text, contentdb::ContentDatabase& database,
                                        ToolContext& context);

/// What the query finds; when that is nothing, with a note on tags that may have been meant. Nothing, after a
/// message, when the database cannot be read.
std::optional<std::vector<contentdb::Found>> searched(const contentdb::Query& query, std::size_t limit,
                                                      contentdb::ContentDatabase& database,
                                                      ToolContext& context);

}  // namespace qvct::tool
