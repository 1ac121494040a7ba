#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// A data file that is built into the library and that another file may replace; `resourceFiles` lists them.
struct ResourceFile {
    std::string_view name;
    std::string_view extension;
    /// Whether the file at the path can be used; else false, and an error. Null where its form is all that
    /// has to be right.
    bool (*isUsable)(const std::string& path, Error* error) = nullptr;
};

/// The path of the file that replaces a resource: the one that `ResourceBundle` finds, provided that it is
/// valid for that resource. Nothing when there is none, when it holds the same bytes as the built-in one, or
/// when it is broken; use the built-in resource then. A broken file is logged once for each of its states,
/// and reported to `error` each time.
/// @cost  One look at the file; its bytes are read when it is new or has changed. Safe from every thread.
QVCT_API std::optional<std::string> replacementFile(const ResourceFile& resource, Error* error = nullptr);

/// Reads the replacement by `read`; without one, or if that answers nothing, `builtIn`. Both answer an
/// optional value.
template <typename Read, typename BuiltIn>
auto replacedOrBuiltIn(const ResourceFile& resource, Read read, BuiltIn builtIn) {
    const auto path = replacementFile(resource);
    auto replaced = path ? read(*path) : std::nullopt;
    return replaced ? replaced : builtIn();
}

}  // namespace qvct
