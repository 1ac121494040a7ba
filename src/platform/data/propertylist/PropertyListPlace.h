#pragma once

#include "platform/base/Error.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <variant>
#include <vector>

namespace qvct {

/// The keys, and in arrays the numbers from 0, that lead from the root of a property list to one of its
/// values.
using PropertyListPath = std::vector<std::variant<std::string, std::size_t>>;

/// A value that is looked for in a text while it is read.
struct PropertyListPlace {
    PropertyListPath path;
    std::optional<std::size_t>
        offset;  ///< Of the value, or of its key in a dictionary; set when it is found.
};

/// The line, from 1, on which the value at the path begins, or its key in a dictionary; if there is none,
/// that of the nearest value above. Nothing for a binary list, which has no lines, and for bytes that are no
/// list.
/// @cost  Reads the list again, for each value that is not there.
std::optional<std::uint64_t> lineOfValue(std::span<const std::uint8_t> bytes, PropertyListPath path);

/// Fills `error`, if asked for, with a fault of the value at the path, whose keys are the part. Always false,
/// as `fail` is.
bool failAtValue(Error* error, ErrorCode code, std::string reason, const PropertyListPath& path);
/// Adds to such an error the path of the list's file, and the line. Always false, as `failIn` is.
bool failInFile(const std::string& file, const PropertyListPath& path, Error* error);

}  // namespace qvct
