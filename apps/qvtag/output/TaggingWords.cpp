#include "output/TaggingWords.h"

#include "platform/base/bytes/Printable.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <set>
#include <utility>

namespace qvct::tool {
namespace {

constexpr std::array<std::string_view, 17> kOrder = {QVCategorySourceIdentifier,
                                                     QVCategoryGenresIdentifier,
                                                     "Sound Descriptors",
                                                     "Negative Emotions",
                                                     "Positive Emotions",
                                                     "Aesthetic",
                                                     "Rhythm",
                                                     "Part",
                                                     "Playing Techniques",
                                                     "Instrument Specifics",
                                                     "Development Over Time",
                                                     "General Characteristics",
                                                     "Number Of Players",
                                                     QVCategoryEffectsIdentifier,
                                                     QVCategoryPlugInsIdentifier,
                                                     QVCategoryLoopSpecificsIdentifier,
                                                     "Artist"};
constexpr int kBookkeeping = 100;

}  // namespace

int rankOfTag(std::string_view category, std::string_view label) {
    constexpr std::array<std::string_view, 4> bookkeeping = {QVCategoryContentTypeIdentifier, "System",
                                                             "Maintenance", QVCategorySoundpackIdentifier};
    const bool isKept = std::find(bookkeeping.begin(), bookkeeping.end(), category) != bookkeeping.end();
    const bool isOfChannels = label == "Mono" || label == "Stereo";  // every sound is one of these
    if (isKept || isOfChannels || label == QVTagAnyKeyType) return kBookkeeping;
    const auto* const place = std::find(kOrder.begin(), kOrder.end(), category);
    return static_cast<int>(place - kOrder.begin());
}

bool isBookkeeping(int rank) {
    return rank >= kBookkeeping;
}

std::vector<Word> wordsForTags(const std::vector<ShownTag>& tags, bool all) {
    std::set<std::pair<std::string_view, std::string_view>> parents;  // category and label
    for (const ShownTag& tag : tags)
        for (const std::string& ancestor : tag.ancestors) parents.emplace(tag.category, ancestor);
    std::vector<std::pair<int, const ShownTag*>> ranked;
    for (const ShownTag& tag : tags) {
        const int rank = rankOfTag(tag.category, tag.label);
        const bool isParent = parents.contains({tag.category, tag.label});
        if (all || (!isBookkeeping(rank) && !isParent)) ranked.emplace_back(rank, &tag);
    }
    std::stable_sort(ranked.begin(), ranked.end(),
                     [](const auto& a, const auto& b) { return a.first < b.first; });
    std::vector<Word> words;
    words.reserve(ranked.size());
    for (const auto& [rank, tag] : ranked) {
        const Color color = isBookkeeping(rank) ? Color::faint : tag->hasLevel ? Color::accent : Color::plain;
        words.push_back({printable(tag->text), color});
    }
    if (words.empty()) words.push_back({"no tags", Color::faint});
    return words;
}

std::vector<Word> wordsForTaggings(const std::vector<std::shared_ptr<TGRTTagging>>& taggings, bool all) {
    std::vector<ShownTag> tags;
    tags.reserve(taggings.size());
    for (const auto& tagging : taggings) {
        ShownTag tag{
            tagging->label(), tagging->category(), textOfTagging(*tagging), {}, tagging->level() != nullptr};
        for (const auto& ancestor : tagging->tag()->ancestors()) tag.ancestors.push_back(ancestor->label());
        tags.push_back(std::move(tag));
    }
    return wordsForTags(tags, all);
}

}  // namespace qvct::tool
