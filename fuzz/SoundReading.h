#pragma once

#include "ExactInput.h"
#include "autotagging/names/NameReader.h"

namespace qvct::fuzz {

/// Reads the names twice: what is said stands where it is said to stand, and the second reading says the
/// same.
inline void requireSoundReading(NameReader& reader, std::span<const std::string_view> names) {
    const NameReading reading = reader.read(names);
    const auto nameOf = [&names](int distance) {
        require(distance >= 0 && static_cast<std::size_t>(distance) < names.size());
        return names[static_cast<std::size_t>(distance)];
    };
    for (const TagClaim& claim : reading.claims) {
        const std::string_view name = nameOf(claim.distance);
        const auto& [what, where, offset] = claim.evidence;
        require(where == name && !what.empty() && offset <= name.size());
        require(name.substr(offset, what.size()) == what);
        require(claim.confidence >= 0 && claim.confidence <= 1 && !claim.label.empty());
    }
    for (const auto& [distance, offset, end] : reading.silences)
        require(offset < end && end <= nameOf(distance).size());
    const NameReading again = reader.read(names);
    require(again.kind == reading.kind && again.tempo == reading.tempo);
    require(again.silences.size() == reading.silences.size() && again.claims.size() == reading.claims.size());
    for (std::size_t i = 0; i < again.claims.size(); ++i) {
        const TagClaim &first = reading.claims[i], &second = again.claims[i];
        require(first.label == second.label && first.confidence == second.confidence);
        require(first.evidence.what == second.evidence.what && first.level == second.level);
    }
}

}  // namespace qvct::fuzz
