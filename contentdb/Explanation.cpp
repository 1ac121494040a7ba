#include "contentdb/Explanation.h"

#include "contentdb/store/codec/ExplanationCodec.h"
#include "contentdb/store/codec/ServiceNumbers.h"

#include <algorithm>

namespace qvct::contentdb {
namespace {

/// Of taggings alone.
Explanation outlineOf(const IndexedItem& item) {
    Explanation explanation;
    for (std::size_t i = 0; i < item.taggings.size(); ++i) {
        const IndexedTagging& tagging = item.taggings[i];
        if (tagging.provenance != Provenance::automatic) continue;
        Explanation::Held& held = explanation.held.emplace_back();
        held.tagging = i;
        if (!tagging.service.empty())
            held.claims.emplace_back().service = serviceOfNumber(numberOfService(tagging.service));
    }
    return explanation;
}

}  // namespace

Explanation explanationOf(const IndexedItem& item) {
    Explanation explanation;
    const auto isOfItem = [&item](const auto& held) { return held.tagging < item.taggings.size(); };
    const bool isKept = !item.explanation.empty() &&
                        decodeExplanation(item.explanation, item.path, explanation) &&
                        std::all_of(explanation.held.begin(), explanation.held.end(), isOfItem);
    if (!isKept) explanation = outlineOf(item);
    for (Explanation::Held& held : explanation.held)
        for (TagClaim& claim : held.claims) claim.label = item.taggings[held.tagging].label;
    return explanation;
}

}  // namespace qvct::contentdb
