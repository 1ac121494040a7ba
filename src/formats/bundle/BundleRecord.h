#pragma once

#include "platform/base/ObjectSet.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TaggingSetAdditions.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

// What the readers and writers of bundles must agree on.

inline std::string projectPlistPathComponent() {
    return "Resources/" + std::string(QVContentTaggingTagsPlistName);
}

/// A tag of the content type, and the sub type that it stands for.
struct BundleSubType {
    std::string_view label;
    std::int64_t subType;
};

/// The first that applies decides.
inline constexpr std::array<BundleSubType, 4> kPatchSubTypes = {
    {{QVTagAudioPatch, 2}, {QVTagAuxPatch, 3}, {QVTagOutputPatch, 4}, {QVTagInstrumentPatch, 1}}};

inline std::int64_t firstSubType(std::span<const BundleSubType> subTypes,
                                 const ObjectSet<TGRTTagging>& taggings) {
    const auto hit = std::find_if(subTypes.begin(), subTypes.end(), [&taggings](const BundleSubType& row) {
        return containsTagWithLabel(taggings, row.label);
    });
    return hit == subTypes.end() ? 0 : hit->subType;
}

}  // namespace qvct
