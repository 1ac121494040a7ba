#include "resources/BuiltInFile.h"

#include "resources/EmbeddedFiles.h"

namespace qvct {

std::span<const std::uint8_t> builtInFile(std::string_view name, std::string_view extension) {
    struct File {
        std::string_view name, extension;
        std::span<const std::uint8_t> bytes;
    };
    static const File files[] = {
        {"DefaultKeywordMapping", "plist", {DefaultKeywordMapping_plist, DefaultKeywordMapping_plist_len}},
        {"DefaultRules", "plist", {DefaultRules_plist, DefaultRules_plist_len}},
        {"DefaultTaxonomy", "plist", {DefaultTaxonomy_plist, DefaultTaxonomy_plist_len}},
        {"EvidenceWeights", "plist", {EvidenceWeights_plist, EvidenceWeights_plist_len}},
        {"ExtractSoftwareInstrumentsRule",
         "js",
         {ExtractSoftwareInstrumentsRule_js, ExtractSoftwareInstrumentsRule_js_len}},
        {"InstrumentModel", "bin", {InstrumentModel_bin, InstrumentModel_bin_len}},
        {"LegacyLoopTaxonomy", "plist", {LegacyLoopTaxonomy_plist, LegacyLoopTaxonomy_plist_len}},
        {"LegacyLoopTaxonomyMapping",
         "csv",
         {LegacyLoopTaxonomyMapping_csv, LegacyLoopTaxonomyMapping_csv_len}},
        {"LegacyVorthalTaxonomy", "plist", {LegacyVorthalTaxonomy_plist, LegacyVorthalTaxonomy_plist_len}},
        {"LegacyVorthalTaxonomyMapping",
         "csv",
         {LegacyVorthalTaxonomyMapping_csv, LegacyVorthalTaxonomyMapping_csv_len}},
        {"LikenessModel", "bin", {LikenessModel_bin, LikenessModel_bin_len}},
        {"NamingHabits", "plist", {NamingHabits_plist, NamingHabits_plist_len}},
        {"PackDisplayNames", "csv", {PackDisplayNames_csv, PackDisplayNames_csv_len}},
        {"QVSearchKit", "js", {QVSearchKit_js, QVSearchKit_js_len}}};
    for (const File& file : files)
        if (file.name == name && file.extension == extension) return file.bytes;
    return {};
}

}  // namespace qvct
