#pragma once

#include "platform/base/Export.h"

#include <cstdint>

/// The bytes of the data files in `resources/data`, as the build found them, without a terminator.
extern "C" {
QVCT_API extern const unsigned char DefaultKeywordMapping_plist[];
QVCT_API extern const std::uint32_t DefaultKeywordMapping_plist_len;
QVCT_API extern const unsigned char DefaultRules_plist[];
QVCT_API extern const std::uint32_t DefaultRules_plist_len;
QVCT_API extern const unsigned char DefaultTaxonomy_plist[];
QVCT_API extern const std::uint32_t DefaultTaxonomy_plist_len;
QVCT_API extern const unsigned char EvidenceWeights_plist[];
QVCT_API extern const std::uint32_t EvidenceWeights_plist_len;
QVCT_API extern const unsigned char ExtractSoftwareInstrumentsRule_js[];
QVCT_API extern const std::uint32_t ExtractSoftwareInstrumentsRule_js_len;
QVCT_API extern const unsigned char InstrumentModel_bin[];
QVCT_API extern const std::uint32_t InstrumentModel_bin_len;
QVCT_API extern const unsigned char LegacyLoopTaxonomy_plist[];
QVCT_API extern const std::uint32_t LegacyLoopTaxonomy_plist_len;
QVCT_API extern const unsigned char LegacyLoopTaxonomyMapping_csv[];
QVCT_API extern const std::uint32_t LegacyLoopTaxonomyMapping_csv_len;
QVCT_API extern const unsigned char LegacyVorthalTaxonomy_plist[];
QVCT_API extern const std::uint32_t LegacyVorthalTaxonomy_plist_len;
QVCT_API extern const unsigned char LegacyVorthalTaxonomyMapping_csv[];
QVCT_API extern const std::uint32_t LegacyVorthalTaxonomyMapping_csv_len;
QVCT_API extern const unsigned char LikenessModel_bin[];
QVCT_API extern const std::uint32_t LikenessModel_bin_len;
QVCT_API extern const unsigned char NamingHabits_plist[];
QVCT_API extern const std::uint32_t NamingHabits_plist_len;
QVCT_API extern const unsigned char PackDisplayNames_csv[];
QVCT_API extern const std::uint32_t PackDisplayNames_csv_len;
QVCT_API extern const unsigned char QVSearchKit_js[];
QVCT_API extern const std::uint32_t QVSearchKit_js_len;
}
