#include "output/TaggingWords.h"

#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <unordered_set>

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
    if (isKept || label == QVTagAnyKeyType) return kBookkeeping;
    const auto* const place = std::find(kOrder.begin(), kOrder.end(), category);
    return static_cast<int>(place - kOrder.begin());
}

bool isBookkeeping(int rank) {
    return rank >= kBookkeeping;
}

std::vector<Word> wordsForTaggings(const std::vector<std::shared_ptr<TGRTTagging>>& taggings, bool all) {
    std::unordered_set<const TGRTTag*> parents;
    for (const auto& tagging : taggings)
        for (auto above = tagging->tag()->parent(); above; above = above->parent())
            parents.insert(above.get());
    std::vector<std::pair<int, Word>> ranked;
    for (const auto& tagging : taggings) {
        const int rank = rankOfTag(tagging->category(), tagging->label());
        const bool isShown = all || (!isBookkeeping(rank) && !parents.contains(tagging->tag().get()));
        const Color color = isBookkeeping(rank) ? Color::faint
                            : tagging->level()  ? Color::accent
                                                : Color::plain;
        if (isShown) ranked.push_back({rank, {textOfTagging(*tagging), color}});
    }
    std::stable_sort(ranked.begin(), ranked.end(),
                     [](const auto& a, const auto& b) { return a.first < b.first; });
    std::vector<Word> words;
    words.reserve(ranked.size());
    for (auto& [_, word] : ranked) words.push_back(std::move(word));
    if (words.empty()) words.push_back({"no tags", Color::faint});
    return words;
}

}  // namespace qvct::tool
