#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// The name of a data file that is built into the library and that another file may replace.
struct ResourceFile {
    std::string_view name;
    std::string_view extension;
};

/// The names of all such files.
inline constexpr ResourceFile kResourceFiles[] = {{"DefaultTaxonomy", "plist"},
                                                  {"DefaultRules", "plist"},
                                                  {"DefaultKeywordMapping", "plist"},
                                                  {"LegacyLoopTaxonomy", "plist"},
                                                  {"LegacyLoopTaxonomyMapping", "csv"},
                                                  {"LegacyVorthalTaxonomy", "plist"},
                                                  {"LegacyVorthalTaxonomyMapping", "csv"},
                                                  {"PackDisplayNames", "csv"},
                                                  {"EvidenceWeights", "plist"},
                                                  {"NamingHabits", "plist"},
                                                  {"QVSearchKit", "js"},
                                                  {"ExtractSoftwareInstrumentsRule", "js"}};

/// The path of the file that replaces a resource: the one that `ResourceBundle` finds, provided that it is
/// valid for that resource. Nothing when there is none or it is broken; use the built-in resource then. A
/// broken file is logged once for each of its states, and reported to `error` each time.
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
