// How long the character of a sound, its loudness and its true peak take, beside libebur128 on the same
// samples, and by how much the two differ over real sounds: bench_character_speed [FOLDER]
#include "Measure.h"
#include "listening/character/Loudness.h"
#include "listening/character/SoundCharacter.h"
#include "listening/character/TruePeak.h"
#include "listening/sound/SoundExcerpt.h"
#include "media/audio/AudioDecoder.h"

#include <cmath>
#include <filesystem>
#include <numbers>
#include <optional>
#include <random>

#ifdef QVCT_HAS_EBUR128
#include <ebur128.h>
#endif

namespace qvct::bench {
namespace {

constexpr double kRate = 44100;

struct Stereo {
    std::vector<float> left, right;
};

struct Levels {
    double loudness, peak;
};

// Two strokes a second: noise and a low tone, both dying away, the noise different in both channels.
Stereo strokes(double seconds, bool isStereo) {
    std::mt19937 random(1);
    std::normal_distribution<float> noise(0, 0.3F);
    Stereo sound;
    for (int i = 0; i < static_cast<int>(seconds * kRate); ++i) {
        const double time = std::fmod(i / kRate, 0.5);
        const auto tone =
            static_cast<float>(0.4 * std::sin(2 * std::numbers::pi * 100 * time) * std::exp(-6 * time));
        const auto fade = static_cast<float>(std::exp(-12 * time));
        sound.left.push_back(tone + fade * noise(random));
        if (isStereo) sound.right.push_back(tone + fade * noise(random));
    }
    return sound;
}

#ifdef QVCT_HAS_EBUR128
std::optional<Levels> levelsByLibrary(const Stereo& sound, double rate, bool wantsPeak) {
    const unsigned channels = sound.right.empty() ? 1 : 2;
    std::vector<float> samples;
    for (std::size_t i = 0; i < sound.left.size(); ++i) {
        samples.push_back(sound.left[i]);
        if (channels == 2) samples.push_back(sound.right[i]);
    }
    const int mode = EBUR128_MODE_I | (wantsPeak ? EBUR128_MODE_TRUE_PEAK : 0);
    ebur128_state* state = ebur128_init(channels, static_cast<unsigned long>(rate), mode);
    ebur128_add_frames_float(state, samples.data(), sound.left.size());
    Levels levels{0, -1000};
    ebur128_loudness_global(state, &levels.loudness);
    for (unsigned channel = 0; wantsPeak && channel < channels; ++channel) {
        double peak = 0;
        ebur128_true_peak(state, channel, &peak);
        levels.peak = std::max(levels.peak, 20 * std::log10(peak));
    }
    ebur128_destroy(&state);
    return levels;
}
#else
std::optional<Levels> levelsByLibrary(const Stereo&, double, bool) {
    return std::nullopt;
}
#endif

void measureSpeed(double seconds, bool isStereo) {
    const Stereo sound = strokes(seconds, isStereo);
    const auto& right = isStereo ? sound.right : sound.left;
    CharacterMeter meter;
    const auto timed = [](auto work) { return medianSeconds(work, 101); };
    const double character = timed([&] { keep(meter.measure(sound.left, right, sound.left, kRate)); });
    const double loudness = timed([&] { keep(integratedLoudness(sound.left, sound.right, kRate)); });
    const double peak = timed([&] { keep(truePeak(sound.left, sound.right)); });
    const double sum = character + loudness + peak;
    printRow(fmt::format("character and loudness of {} s, {}", seconds, isStereo ? "stereo" : "mono"),
             fmt::format("{:.0f} us = {:.0f} times real time", sum * 1e6, seconds / sum), "5,000 times");
    printRow("  of it character", fmt::format("{:.0f} us", character * 1e6),
             seconds < 1 ? "under 150 us" : "");
    printRow("  of it loudness", fmt::format("{:.0f} us", loudness * 1e6), "");
    printRow("  of it true peak", fmt::format("{:.0f} us", peak * 1e6), "");
    if (!levelsByLibrary(sound, kRate, false)) return;
    printRow("  loudness by libebur128",
             fmt::format("{:.0f} us", 1e6 * timed([&] { keep(levelsByLibrary(sound, kRate, false)); })), "");
    printRow(
        "  loudness and true peak by libebur128",
        fmt::format("{:.0f} us", 1e6 * medianSeconds([&] { keep(levelsByLibrary(sound, kRate, true)); })),
        "");
}

void compareOver(const std::string& folder) {
    std::vector<double> loudness, peaks;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(folder)) {
        const auto decoder = AudioDecoder::open(entry.path().string());
        if (!decoder) continue;
        const auto excerpt = SoundExcerpt::of(*decoder, 10);
        if (excerpt.seconds() < 0.4) continue;  // which the library does not measure
        Stereo sound{{excerpt.left().begin(), excerpt.left().end()}, {}};
        if (excerpt.isStereo()) sound.right.assign(excerpt.right().begin(), excerpt.right().end());
        const auto ours = integratedLoudness(sound.left, sound.right, excerpt.sampleRate());
        const auto theirs = levelsByLibrary(sound, excerpt.sampleRate(), true);
        if (!ours || !theirs) continue;
        loudness.push_back(std::abs(*ours - theirs->loudness));
        peaks.push_back(std::abs(*truePeak(sound.left, sound.right) - theirs->peak));
    }
    if (loudness.empty()) return;
    printRow(fmt::format("{} sounds, loudness beside libebur128's", loudness.size()),
             fmt::format("{:.5f} LU at most", *std::max_element(loudness.begin(), loudness.end())),
             "under 0.01");
    printRow("  true peak", fmt::format("{:.5f} dB at most", *std::max_element(peaks.begin(), peaks.end())),
             "under 0.01");
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct::bench;
    for (const bool isStereo : {false, true}) {
        for (const double seconds : {0.5, 8.0}) measureSpeed(seconds, isStereo);
    }
    if (count > 1) compareOver(arguments[1]);
}
