#include "demo/synthesis/Drums.h"

#include <cmath>
#include <map>
#include <numbers>

namespace qvct::demo {
namespace {

/// A drum is a tone that falls in pitch, a burst or several of filtered noise, and a clang of square waves.
struct DrumSound {
    double seconds = 0.3;
    double level = 1;  // among the drums of a kit
    double tone = 0, fromHertz = 200, toHertz = 100, fall = 0.03, toneDecay = 0.1;
    double noise = 0, noiseDecay = 0.1, lowCut = 200, highCut = 12000;
    int bursts = 1;
    double clang = 0, clangHertz = 540, clangDecay = 0.1;
};

constexpr double kBurstSpacing = 0.011;

const DrumSound& soundOf(Drum drum) {
    // clang-format off
    static const std::map<Drum, DrumSound> sounds = {
        {Drum::kick, {.seconds = 0.5, .tone = 1, .fromHertz = 210, .toHertz = 47, .fall = 0.035, .toneDecay = 0.16,
                      .noise = 0.1, .noiseDecay = 0.004, .lowCut = 1500}},
        {Drum::snare, {.seconds = 0.3, .level = 0.8, .tone = 0.5, .fromHertz = 260, .toHertz = 185, .fall = 0.02,
                       .toneDecay = 0.07, .noise = 0.7, .noiseDecay = 0.075, .lowCut = 900, .highCut = 9000}},
        {Drum::clap, {.seconds = 0.35, .level = 0.7, .noise = 1, .noiseDecay = 0.07, .lowCut = 700, .highCut = 3800,
                      .bursts = 3}},
        {Drum::rim, {.seconds = 0.1, .level = 0.4, .tone = 0.8, .fromHertz = 1750, .toHertz = 1650, .toneDecay = 0.012,
                     .noise = 0.3, .noiseDecay = 0.008, .lowCut = 1000}},
        {Drum::closedHat, {.seconds = 0.09, .level = 0.3, .noise = 0.6, .noiseDecay = 0.02, .lowCut = 7500, .highCut = 16000,
                           .clang = 0.35, .clangHertz = 540, .clangDecay = 0.018}},
        {Drum::openHat, {.seconds = 0.45, .level = 0.35, .noise = 0.6, .noiseDecay = 0.14, .lowCut = 7000, .highCut = 16000,
                         .clang = 0.35, .clangHertz = 540, .clangDecay = 0.13}},
        {Drum::ride, {.seconds = 0.7, .level = 0.3, .noise = 0.3, .noiseDecay = 0.2, .lowCut = 6000, .highCut = 14000,
                      .clang = 0.4, .clangHertz = 830, .clangDecay = 0.28}},
        {Drum::crash, {.seconds = 1.6, .level = 0.6, .noise = 0.9, .noiseDecay = 0.5, .lowCut = 4000, .highCut = 15000,
                       .clang = 0.3, .clangHertz = 620, .clangDecay = 0.4}},
        {Drum::lowTom, {.seconds = 0.5, .level = 0.9, .tone = 1, .fromHertz = 150, .toHertz = 92, .fall = 0.06,
                        .toneDecay = 0.17, .noise = 0.1, .noiseDecay = 0.02, .highCut = 3000}},
        {Drum::highTom, {.seconds = 0.4, .level = 0.8, .tone = 1, .fromHertz = 240, .toHertz = 150, .fall = 0.05,
                         .toneDecay = 0.13, .noise = 0.1, .noiseDecay = 0.02, .highCut = 4000}},
        {Drum::cowbell, {.seconds = 0.35, .level = 0.35, .lowCut = 400, .clang = 1, .clangHertz = 560, .clangDecay = 0.09}},
        {Drum::shaker, {.seconds = 0.12, .level = 0.25, .noise = 0.9, .noiseDecay = 0.03, .lowCut = 5000, .highCut = 12000,
                        .bursts = 2}},
        {Drum::tambourine, {.seconds = 0.3, .level = 0.4, .noise = 0.5, .noiseDecay = 0.06, .lowCut = 8000, .highCut = 17000,
                            .bursts = 2, .clang = 0.5, .clangHertz = 2300, .clangDecay = 0.07}},
        {Drum::bongo, {.seconds = 0.25, .level = 0.6, .tone = 1, .fromHertz = 420, .toHertz = 345, .fall = 0.015,
                       .toneDecay = 0.06, .noise = 0.15, .noiseDecay = 0.006}},
        {Drum::conga, {.seconds = 0.4, .level = 0.7, .tone = 1, .fromHertz = 230, .toHertz = 190, .fall = 0.02,
                       .toneDecay = 0.12, .noise = 0.12, .noiseDecay = 0.008, .highCut = 5000}},
    };
    // clang-format on
    return sounds.at(drum);
}

struct KitCharacter {
    double tune = 1, length = 1, drive = 1, highCut = 16000;
};

const KitCharacter& characterOf(Kit kit) {
    static const std::map<Kit, KitCharacter> characters = {
        {Kit::acoustic, {.tune = 1.1, .length = 1.1, .drive = 1.2}},
        {Kit::house, {}},
        {Kit::techno, {.tune = 0.96, .length = 0.9, .drive = 4}},
        {Kit::boomBap, {.tune = 1.05, .length = 0.8, .drive = 2, .highCut = 9000}},
        {Kit::loFi, {.tune = 0.9, .length = 0.9, .drive = 2.5, .highCut = 4500}},
    };
    return characters.at(kit);
}

void addTone(Signal& signal, const DrumSound& sound, const KitCharacter& kit, int rate) {
    double phase = 0;
    for (std::size_t i = 0; i < signal.size(); ++i) {
        const double time = static_cast<double>(i) / rate;
        const double hertz = sound.toHertz + (sound.fromHertz - sound.toHertz) * decayed(time, sound.fall);
        phase += 2 * std::numbers::pi * kit.tune * hertz / rate;
        signal[i] += sound.tone * std::sin(phase) * decayed(time, sound.toneDecay * kit.length);
    }
}

/// All bursts but the last are short, as of hands that do not clap exactly together.
double burstLevel(const DrumSound& sound, double time, double length) {
    const int burst = std::min(static_cast<int>(time / kBurstSpacing), sound.bursts - 1);
    const bool last = burst == sound.bursts - 1;
    return decayed(time - burst * kBurstSpacing, last ? sound.noiseDecay * length : kBurstSpacing / 3);
}

void addNoise(Signal& signal, const DrumSound& sound, const KitCharacter& kit, int rate) {
    Noise noise(static_cast<std::uint32_t>(sound.lowCut));
    Signal hiss(signal.size());
    for (std::size_t i = 0; i < hiss.size(); ++i) {
        hiss[i] = noise.next() * burstLevel(sound, static_cast<double>(i) / rate, kit.length);
    }
    passBand(hiss, rate, sound.lowCut, sound.highCut);
    for (std::size_t i = 0; i < signal.size(); ++i) signal[i] += 1.6 * sound.noise * hiss[i];
}

/// Square waves in ratios that share no harmonics, as in the cymbals of drum machines.
void addClang(Signal& signal, const DrumSound& sound, const KitCharacter& kit, int rate) {
    static constexpr std::array<double, 4> ratios = {1, 1.48, 2.63, 3.37};
    Signal metal(signal.size());
    for (const double ratio : ratios) {
        Oscillator oscillator(rate, 0);
        for (double& sample : metal) sample += oscillator.square(kit.tune * sound.clangHertz * ratio) / 4;
    }
    passBand(metal, rate, std::max(sound.lowCut, sound.clangHertz), sound.highCut);
    for (std::size_t i = 0; i < signal.size(); ++i) {
        signal[i] += 1.5 * sound.clang * metal[i] *
                     decayed(static_cast<double>(i) / rate, sound.clangDecay * kit.length);
    }
}

void scaleToPeak(Signal& signal, double level) {
    double peak = 0;
    for (const double sample : signal) peak = std::max(peak, std::abs(sample));
    for (double& sample : signal) sample *= level / peak;
}

}  // namespace

Signal drumHit(Drum drum, Kit kit, int rate) {
    const DrumSound& sound = soundOf(drum);
    const KitCharacter& character = characterOf(kit);
    Signal signal(framesIn(sound.seconds, rate));
    if (sound.tone > 0) addTone(signal, sound, character, rate);
    if (sound.noise > 0) addNoise(signal, sound, character, rate);
    if (sound.clang > 0) addClang(signal, sound, character, rate);
    drive(signal, character.drive);
    if (character.highCut < 16000) passBand(signal, rate, 20, character.highCut);
    scaleToPeak(signal, sound.level);
    fadeOut(signal, rate, 0.01);
    return signal;
}

}  // namespace qvct::demo
