#include "taxonomy/TGRTTaggingCollection.h"

#include <optional>

namespace qvct {

TGRTTaggingCollection::Taggings& TGRTTaggingCollection::taggingsOfNode(const FileURLNode& node) {
    const auto [entry, isNew] =
        indexOfURL_.try_emplace(node.fileURL().absoluteString(), taggingsOfNodes_.size());
    if (isNew) taggingsOfNodes_.emplace_back();
    return taggingsOfNodes_[entry->second];
}

void TGRTTaggingCollection::setTaggings(const Taggings& taggings, const Node& forNode) {
    if (forNode) taggingsOfNode(*forNode) = taggings;
}

void TGRTTaggingCollection::addTaggings(const Taggings& taggings, const Node& forNode) {
    if (forNode) taggingsOfNode(*forNode).insertAll(taggings);
}

void TGRTTaggingCollection::removeTaggings(const Taggings& taggings, const Node& forNode) {
    if (!forNode) return;
    Taggings& stored = taggingsOfNode(*forNode);
    for (const auto& tagging : taggings) stored.erase(*tagging);
}

void TGRTTaggingCollection::setTaggings(const Taggings& taggings, const std::vector<Node>& forNodes) {
    for (const Node& node : forNodes) setTaggings(taggings, node);
}

void TGRTTaggingCollection::addTaggings(const Taggings& taggings, const std::vector<Node>& forNodes) {
    for (const Node& node : forNodes) addTaggings(taggings, node);
}

void TGRTTaggingCollection::removeTaggings(const Taggings& taggings, const std::vector<Node>& forNodes) {
    for (const Node& node : forNodes) removeTaggings(taggings, node);
}

TGRTTaggingCollection::Taggings TGRTTaggingCollection::taggings() const {
    Taggings all;
    for (const Taggings& taggings : taggingsOfNodes_) all.insertAll(taggings);
    return all;
}

TaggingState TGRTTaggingCollection::taggingStateForTagging(const TGRTTagging& tagging,
                                                           const std::vector<Node>& andNodes) const {
    std::optional<bool> answer;
    for (const Node& node : andNodes) {
        const auto hit = node ? indexOfURL_.find(node->fileURL().absoluteString()) : indexOfURL_.end();
        if (hit == indexOfURL_.end()) continue;
        const bool isPresent = taggingsOfNodes_[hit->second].contains(tagging);
        if (answer && *answer != isPresent) return kTaggingStateSome;
        answer = isPresent;
    }
    return answer.value_or(false) ? kTaggingStateAll : kTaggingStateNone;
}

}  // namespace qvct
