// How evenly sounds spread on the scales of character: bench_character_spread [--deciles] FOLDER...
// Prints for each folder and scale the largest distance between the share of sounds below a level and the
// level itself (Kolmogorov and Smirnov's; 0 is wholly even), and for all folders together how the scales
// correlate. Each folder counts the same, however many sounds it has. With --deciles, the measures that the
// scales are made from.
#include "listening/character/SoundCharacter.h"
#include "listening/sound/SoundExcerpt.h"
#include "media/audio/AudioDecoder.h"

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <string_view>
#include <vector>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

struct Sound {
    SoundCharacter character;
    double weight;
};

std::vector<Sound> soundsBelow(const std::string& folder) {
    constexpr auto kOptions = std::filesystem::directory_options::follow_directory_symlink;
    std::vector<Sound> sounds;
    CharacterMeter meter;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(folder, kOptions)) {
        if (!entry.is_regular_file()) continue;
        const auto decoder = AudioDecoder::open(entry.path().string());
        if (!decoder) continue;
        const auto excerpt = SoundExcerpt::of(*decoder, 10);
        const auto character =
            meter.measure(excerpt.left(), excerpt.right(), excerpt.mono(), excerpt.sampleRate());
        if (character) sounds.push_back({*character, 1});
    }
    for (Sound& sound : sounds) sound.weight = 1 / static_cast<double>(sounds.size());
    return sounds;
}

struct Weighted {
    double value, weight;
};

// Ascending, with weights that add up to 1. What has one channel, or a side 30 dB below the middle, says
// nothing of how stereo sounds spread.
std::vector<Weighted> valuesOf(const std::vector<Sound>& sounds, CharacterScale scale,
                               double SoundCharacter::Value::*field) {
    std::vector<Weighted> values;
    double sum = 0;
    for (const Sound& sound : sounds) {
        if (scale == CharacterScale::kNarrowWide && sound.character[scale].measure < 0.001) continue;
        values.push_back({sound.character[scale].*field, sound.weight});
        sum += sound.weight;
    }
    for (Weighted& value : values) value.weight /= sum;
    std::sort(values.begin(), values.end(), [](auto a, auto b) { return a.value < b.value; });
    return values;
}

double unevenness(const std::vector<Sound>& sounds, CharacterScale scale) {
    double below = 0, largest = 0;
    for (const auto& [level, weight] : valuesOf(sounds, scale, &SoundCharacter::Value::level)) {
        largest = std::max(largest, std::abs(level - below));
        below += weight;
        largest = std::max(largest, std::abs(level - below));
    }
    return largest;
}

void printDeciles(const std::vector<Sound>& sounds, CharacterScale scale) {
    fmt::print("{:<18}", nameOf(scale));
    double below = 0;
    auto share = kCharacterShares.begin() + 1;
    for (const auto& [measure, weight] : valuesOf(sounds, scale, &SoundCharacter::Value::measure)) {
        below += weight;
        for (; share + 1 < kCharacterShares.end() && below >= *share; ++share) fmt::print(" {:.4g}", measure);
    }
    fmt::print("\n");
}

double correlation(const std::vector<Sound>& sounds, CharacterScale one, CharacterScale other) {
    double x = 0, y = 0, xx = 0, yy = 0, xy = 0, n = 0;
    for (const Sound& sound : sounds) {
        const double a = sound.character[one].level, b = sound.character[other].level, w = sound.weight;
        n += w, x += w * a, y += w * b, xx += w * a * a, yy += w * b * b, xy += w * a * b;
    }
    return (n * xy - x * y) / std::sqrt((n * xx - x * x) * (n * yy - y * y));
}

void printCorrelations(const std::vector<Sound>& sounds) {
    for (std::size_t row = 0; row < kCharacterScales; ++row) {
        fmt::print("{:<30}", nameOf(characterScale(row)));
        for (std::size_t column = 0; column < row; ++column)
            fmt::print(" {:6.2f}", correlation(sounds, characterScale(row), characterScale(column)));
        fmt::print("\n");
    }
}

void printRow(std::string_view name, const std::vector<Sound>& sounds) {
    fmt::print("{:<24} {:5}", name, sounds.size());
    for (std::size_t i = 0; i < kCharacterScales; ++i)
        fmt::print(" {:6.3f}", unevenness(sounds, characterScale(i)));
    fmt::print("\n");
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct;
    using namespace qvct::bench;
    const bool wantsDeciles = count > 1 && std::string_view(arguments[1]) == "--deciles";
    std::vector<Sound> all;
    for (int i = wantsDeciles ? 2 : 1; i < count; ++i) {
        const auto sounds = soundsBelow(arguments[i]);
        if (!wantsDeciles) printRow(std::filesystem::path(arguments[i]).filename().string(), sounds);
        all.insert(all.end(), sounds.begin(), sounds.end());
    }
    if (wantsDeciles) {
        for (std::size_t i = 0; i < kCharacterScales; ++i) printDeciles(all, characterScale(i));
        return 0;
    }
    printRow("all", all);
    printCorrelations(all);
}
