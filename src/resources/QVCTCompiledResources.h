#pragma once

#include "platform/data/PropertyList.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <variant>
#include <vector>

namespace qvct {

/// The data files inside the library's own image, for when no resource folder has them.
///
/// Each call converts the bytes anew and hands the result over; nothing is cached. An operation answers
/// nothing when the bytes are not what they should be.
/// @cost  Of parsing: about a millisecond for the largest. Safe from every thread.
class QVCTCompiledResources {
  public:
    using Lines = std::vector<std::string>;
    using Resource = std::variant<std::monostate, PropertyList, std::string, Lines>;

    /// What `compiledResourceWithData` makes of the bytes.
    enum Kind : int { kPropertyList = 0, kText = 1, kTextLines = 2 };

    /// The property list, the text, or the text's lines (split at every "\n", so that a final line break
    /// gives an empty last line). Empty data is logged and, like an unknown kind, answers nothing.
    static Resource compiledResourceWithData(std::span<const unsigned char> data, int type);

    static std::optional<PropertyList::Dictionary> DefaultTaxonomyPlist();
    static std::optional<PropertyList::Dictionary> LegacyVorthalTaxonomyPlist();
    static std::optional<PropertyList::Dictionary> LegacyLoopTaxonomyPlist();
    static std::optional<PropertyList::Dictionary> DefaultRulesPlist();
    static std::optional<PropertyList::Dictionary> DefaultKeywordMappingPlist();
    static std::optional<PropertyList::Dictionary> NamingHabitsPlist();
    static std::optional<PropertyList::Dictionary> EvidenceWeightsPlist();
    static std::optional<std::string> QVSearchKitJS();
    static std::optional<std::string> ExtractSoftwareInstrumentsRuleJS();
    static std::optional<Lines> LegacyLoopTaxonomyMapping();
    static std::optional<Lines> LegacyVorthalTaxonomyMapping();
    /// "pack identifier;display name" of every content pack.
    static std::optional<Lines> PackDisplayNames();
};

}  // namespace qvct
