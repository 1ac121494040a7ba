#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/data/PropertyList.h"

#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// A file of data that the library carries, and that another may replace.
struct ResourceFile {
    std::string_view name;
    std::string_view extension;
};

inline constexpr ResourceFile kResourceFiles[] = {{"DefaultTaxonomy", "plist"},
                                                  {"DefaultRules", "plist"},
                                                  {"DefaultKeywordMapping", "plist"},
                                                  {"LegacyLoopTaxonomy", "plist"},
                                                  {"LegacyLoopTaxonomyMapping", "csv"},
                                                  {"LegacyVorthalTaxonomy", "plist"},
                                                  {"LegacyVorthalTaxonomyMapping", "csv"},
                                                  {"PackDisplayNames", "csv"},
                                                  {"QVSearchKit", "js"},
                                                  {"ExtractSoftwareInstrumentsRule", "js"}};

/// The path of the file that replaces a resource: the one that `ResourceBundle` finds, provided that it is
/// valid for that resource. Nothing when there is none or it is broken; use the built-in resource then. A
/// broken file is logged once for each of its states, and reported to `error` each time.
/// @cost  One look at the file; its bytes are read when it is new or has changed. Safe from every thread.
std::optional<std::string> replacementFile(const ResourceFile& resource, Error* error = nullptr);

/// The property list in a file, with the entries that the resource of that name must have; else nothing, and
/// an error.
std::optional<PropertyList::Dictionary> readResourceDictionary(std::string_view name, const std::string& path,
                                                               Error* error = nullptr);

/// What `read` makes of the replacement file at a path; if there is none, what `builtIn` gives. Both answer
/// an optional value.
template <typename Read, typename BuiltIn>
auto replacedOrBuiltIn(const ResourceFile& resource, Read read, BuiltIn builtIn) {
    const auto path = replacementFile(resource);
    auto replaced = path ? read(*path) : std::nullopt;
    return replaced ? replaced : builtIn();
}

}  // namespace qvct
