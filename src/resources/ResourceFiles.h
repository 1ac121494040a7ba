#pragma once

#include <string_view>

namespace qvct {

/// A file of data that the library carries, and that a folder of resources may replace.
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

}  // namespace qvct
