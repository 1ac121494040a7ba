#include "listening/character/SoundCharacter.h"

#include "listening/character/Attack.h"
#include "listening/character/Emphasis.h"
#include "listening/character/SpectralCharacter.h"
#include "listening/character/StereoWidth.h"

#include <algorithm>

namespace qvct {
namespace {

constexpr double kMostSeconds = 10;

float meanOf(std::span<const float> samples) {
    constexpr std::size_t kRun = 4096;
    double sum = 0;
    for (std::size_t at = 0; at < samples.size(); at += kRun) {
        Lanes run(0);
        const std::size_t end = std::min(samples.size(), at + kRun);
        std::size_t i = at;
        for (; i + 4 <= end; i += 4) run += lanesAt(&samples[i]);
        for (; i < end; ++i) run.v[0] += samples[i];
        sum += sumOf(run);
    }
    return static_cast<float>(sum / static_cast<double>(std::max<std::size_t>(1, samples.size())));
}

}  // namespace

struct CharacterMeter::Tables {
    explicit Tables(double sampleRate) : rate(sampleRate), spectral(sampleRate) {}

    double rate;
    SpectralCharacter spectral;
};

CharacterMeter::CharacterMeter() = default;
CharacterMeter::~CharacterMeter() = default;

std::optional<SoundCharacter> CharacterMeter::measure(std::span<const float> left,
                                                      std::span<const float> right,
                                                      std::span<const float> mono, double sampleRate) {
    if (!tables_ || tables_->rate != sampleRate) tables_ = std::make_unique<Tables>(sampleRate);
    const auto count = std::min(mono.size(), static_cast<std::size_t>(kMostSeconds * sampleRate));
    mono = mono.first(count);
    const float mean = meanOf(mono);
    const auto spectral = tables_->spectral.measure(mono, mean);
    if (!spectral) return std::nullopt;
    const auto attack = steepestAttack(mono, mean, sampleRate);
    if (!attack) return std::nullopt;
    const bool isStereo = left.data() != right.data();
    const double width = isStereo ? stereoWidth(left.first(count), right.first(count), sampleRate) : 0;

    SoundCharacter character{};
    const auto set = [&character](CharacterScale scale, double measure) {
        character.values[indexOf(scale)] = {measure, levelOf(scale, measure)};
    };
    set(CharacterScale::kBrightDark, spectral->sharpness);
    set(CharacterScale::kColdWarm, spectral->warmth);
    set(CharacterScale::kSoftHard, attack->hardness());
    set(CharacterScale::kSmoothRough, spectral->roughness);
    set(CharacterScale::kTonalNonTonal, spectral->flatness);
    set(CharacterScale::kLowHigh, spectral->height);
    set(CharacterScale::kNarrowWide, width);
    set(CharacterScale::kSimpleComplex, spectral->partials);
    return character;
}

}  // namespace qvct
