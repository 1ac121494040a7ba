#include "contentdb/query/SoundCopies.h"

#include "media/loopfile/RecordKeys.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <string_view>
#include <variant>

namespace qvct::contentdb {
namespace {

constexpr double kSameLength = 0.05;  // seconds

/// What makes one copy better than another: the more, the better.
struct Advantage {
    std::string_view name;
    double (*of)(const SoundCopy&);
};

constexpr std::array kAdvantages = std::to_array<Advantage>(
    {{"not compressed", [](const SoundCopy& copy) { return copy.bitDepth > 0 ? 1.0 : 0.0; }},
     {"longer", [](const SoundCopy& copy) { return std::round(copy.seconds / kSameLength); }},
     {"higher rate", [](const SoundCopy& copy) { return copy.sampleRate; }},
     {"more bits", [](const SoundCopy& copy) { return copy.bitDepth; }},
     {"more channels", [](const SoundCopy& copy) { return copy.channels; }}});

/// The first advantage in which they differ, or their number.
std::size_t firstDifference(const SoundCopy& a, const SoundCopy& b) {
    std::size_t i = 0;
    while (i < kAdvantages.size() && kAdvantages[i].of(a) == kAdvantages[i].of(b)) ++i;
    return i;
}

bool isBetter(const SoundCopy& a, const SoundCopy& b) {
    const std::size_t at = firstDifference(a, b);
    return at < kAdvantages.size() ? kAdvantages[at].of(a) > kAdvantages[at].of(b) : a.id < b.id;
}

double numberOf(const IndexedItem& item, std::string_view key) {
    for (const auto& [itsKey, value] : item.values) {
        const auto* number = std::get_if<double>(&value);
        if (itsKey == key && number != nullptr && std::isfinite(*number)) return *number;
    }
    return 0;
}

}  // namespace

SoundCopy copyOf(ItemId id, const IndexedItem& item) {
    SoundCopy copy;
    copy.id = id;
    copy.path = item.path;
    copy.size = item.stamp.size;
    copy.seconds = numberOf(item, QVContentKeyLengthInSeconds);
    copy.sampleRate = numberOf(item, kSampleRateKey);
    copy.bitDepth = numberOf(item, kBitDepthKey);
    copy.channels = numberOf(item, kChannelCountKey);
    return copy;
}

DuplicateGroup bestFirst(std::vector<std::pair<SoundCopy, std::string>> copies) {
    std::sort(copies.begin(), copies.end(),
              [](const auto& a, const auto& b) { return isBetter(a.first, b.first); });
    DuplicateGroup group;
    std::array<bool, kAdvantages.size() + 1> decides{};
    for (auto& [copy, payload] : copies) {
        const bool isBest = group.copies.empty();
        copy.isExact = isBest || (!payload.empty() && payload == copies.front().second);
        if (!isBest) decides[firstDifference(group.copies.front(), copy)] = true;
        group.copies.push_back(std::move(copy));
    }
    for (std::size_t i = 0; i < kAdvantages.size(); ++i)
        if (decides[i]) group.reasons.emplace_back(kAdvantages[i].name);
    return group;
}

}  // namespace qvct::contentdb
