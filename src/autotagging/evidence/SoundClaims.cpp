#include "autotagging/evidence/SoundClaims.h"

#include "listening/HeardSound.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <string>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kService = "sound";

/// Finer levels than a hundredth tell nobody anything.
constexpr double kSteps = 100;

/// Of all sounds this share lies beyond at each end.
constexpr double kPole = 0.15;
/// What is bright is mostly cold and high as well: a few say enough.
constexpr std::size_t kMostPoles = 3;
constexpr std::string_view kWidth = "Narrow / Wide";

TagClaim claimOf(std::string label, double confidence, std::string what) {
    TagClaim claim;
    claim.label = std::move(label);
    claim.service = kService;
    claim.confidence = confidence;
    claim.evidence = {std::move(what), "heard", 0};
    return claim;
}

/// The likeliest alone, whose confidence says already how likely others are.
void addInstrument(const HeardSound& sound, std::vector<TagClaim>& claims) {
    if (sound.instruments.empty()) return;
    const auto& [label, confidence] = sound.instruments.front();
    claims.push_back(claimOf(label, confidence, fmt::format("like one, {:.0f} %", confidence * 100)));
}

void addKey(const HeardSound& sound, std::vector<TagClaim>& claims) {
    if (!sound.key) return;
    const auto& [tonic, isMinor, confidence] = *sound.key;
    const auto what = fmt::format("notes of {} {}", QVTagsOfKeys[static_cast<std::size_t>(tonic)],
                                  isMinor ? "minor" : "major");
    claims.push_back(claimOf(std::string(QVTagsOfKeys[static_cast<std::size_t>(tonic)]), confidence, what));
    claims.push_back(claimOf(std::string(isMinor ? QVTagMinorKeyType : QVTagMajorKeyType), confidence, what));
}

void addChannels(const HeardSound& sound, std::vector<TagClaim>& claims) {
    if (sound.traits.empty()) return;  // silence
    claims.push_back(
        claimOf(sound.isStereo ? "Stereo" : "Mono", 1,
                sound.isStereo ? "channels that differ" : "one channel, or two that are the same"));
}

/// The nearer to the pole, the surer. That one channel is narrow need not be said.
void addTraits(const HeardSound& sound, std::vector<TagClaim>& claims) {
    std::vector<TagClaim> poles;
    for (const auto& [scale, level, measure, value] : sound.traits) {
        const double fromPole = std::min(level, 1 - level);
        if (fromPole >= kPole || (scale == kWidth && !sound.isStereo)) continue;
        poles.push_back(claimOf(std::string(scale), 1 - fromPole, fmt::format("{} {:.3g}", measure, value)));
        poles.back().level = std::round(level * kSteps) / kSteps;
    }
    std::stable_sort(poles.begin(), poles.end(),
                     [](const TagClaim& a, const TagClaim& b) { return a.confidence > b.confidence; });
    poles.resize(std::min(poles.size(), kMostPoles));
    std::move(poles.begin(), poles.end(), std::back_inserter(claims));
}

}  // namespace

std::vector<TagClaim> claimsOfSound(const HeardSound& sound) {
    std::vector<TagClaim> claims;
    addInstrument(sound, claims);
    addKey(sound, claims);
    addChannels(sound, claims);
    addTraits(sound, claims);
    return claims;
}

}  // namespace qvct
