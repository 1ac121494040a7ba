#include "operations/StoredReport.h"

#include "contentdb/Explanation.h"
#include "platform/text/Decimal.h"

#include <memory>
#include <optional>
#include <utility>

namespace qvct::tool {
namespace {

using namespace contentdb;

std::shared_ptr<TGRTTag> tagOf(const IndexedTagging& tagging, TGRTTaxonomy& taxonomy) {
    return taxonomy.findOrCreateTagWithLabel(tagging.label, tagging.category);
}

/// As it was before it was stored in single precision.
std::optional<double> levelOf(const IndexedTagging& tagging) {
    if (!tagging.level) return std::nullopt;
    return decimalOf(double{*tagging.level});
}

std::shared_ptr<TGRTTagging> taggingOf(const IndexedTagging& its, TGRTTaxonomy& taxonomy) {
    const auto weight = levelOf(its);
    const auto level = weight ? TGRTLevel::levelWithWeight(*weight) : nullptr;
    auto tagging = TGRTTagging::initWithTag(tagOf(its, taxonomy), level);
    if (tagging) tagging->setIsAutoTagging(its.isAuto);
    return tagging;
}

}  // namespace

ExplainedItem storedReport(const IndexedItem& item, TGRTTaxonomy& taxonomy) {
    ExplainedItem explained;
    for (const IndexedTagging& its : item.taggings) {
        if (its.provenance == Provenance::stored) explained.stored.insert(taggingOf(its, taxonomy));
        if (its.provenance == Provenance::virtualTag) explained.following.insert(taggingOf(its, taxonomy));
    }
    Explanation explanation = explanationOf(item);
    explained.report.kind = explanation.kind;
    explained.report.tempo = explanation.tempo;
    explained.report.isTempoFromLength = explanation.isTempoFromLength;
    explained.report.beats = explanation.beats;
    explained.report.resolution.dropped = std::move(explanation.dropped);
    for (Explanation::Held& held : explanation.held) {
        const IndexedTagging& its = item.taggings[held.tagging];
        explained.report.resolution.held.push_back(
            {tagOf(its, taxonomy), levelOf(its), held.confidence, std::move(held.claims)});
    }
    return explained;
}

}  // namespace qvct::tool
