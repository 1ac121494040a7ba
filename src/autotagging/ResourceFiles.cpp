#include "autotagging/ResourceFiles.h"

#include "autotagging/evidence/EvidenceWeights.h"
#include "autotagging/names/NamingHabits.h"
#include "resources/DefaultListeningModels.h"

namespace qvct {

std::span<const ResourceFile> resourceFiles() {
    static const ResourceFile files[] = {{"DefaultTaxonomy", "plist"},
                                         {"DefaultRules", "plist"},
                                         {"DefaultKeywordMapping", "plist"},
                                         {"LegacyLoopTaxonomy", "plist"},
                                         {"LegacyLoopTaxonomyMapping", "csv"},
                                         {"LegacyVorthalTaxonomy", "plist"},
                                         {"LegacyVorthalTaxonomyMapping", "csv"},
                                         {"PackDisplayNames", "csv"},
                                         EvidenceWeights::file(),
                                         NamingHabits::file(),
                                         instrumentModelFile(),
                                         likenessModelFile(),
                                         {"QVSearchKit", "js"},
                                         {"ExtractSoftwareInstrumentsRule", "js"}};
    return files;
}

}  // namespace qvct
