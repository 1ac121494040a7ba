#include "demo/synthesis/Timbres.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <numbers>

namespace qvct::demo {
namespace {

enum class Wave { saw, square, fm, string };

/// A classic voice: oscillators in unison, a low-pass filter that opens and closes, a level envelope.
struct Voice {
    Wave wave = Wave::saw;
    int unison = 1;
    double detuneCents = 0;
    double attack = 0.003, decay = 0.3, sustain = 0.7, release = 0.05;
    double cutoff = 8000, opening = 0, openingDecay = 0.2, quality = 0.7;
    double fmRatio = 1, fmDepth = 0, fmDecay = 0.3;
    double vibratoCents = 0;
    double level = 0.5;
    bool vowel = false;
};

const Voice& voiceOf(Timbre timbre) {
    // clang-format off
    static const std::map<Timbre, Voice> voices = {
        {Timbre::subBass, {.wave = Wave::fm, .decay = 1, .fmDepth = 0.3, .level = 0.7}},
        {Timbre::analogBass, {.unison = 2, .detuneCents = 7, .decay = 0.2, .sustain = 0.5, .cutoff = 250,
                              .opening = 1600, .openingDecay = 0.12, .quality = 1.2, .level = 0.6}},
        {Timbre::acidBass, {.wave = Wave::square, .decay = 0.25, .sustain = 0.4, .cutoff = 220, .opening = 2600,
                            .openingDecay = 0.09, .quality = 5, .level = 0.3}},
        {Timbre::pluck, {.unison = 2, .detuneCents = 8, .decay = 0.18, .sustain = 0, .cutoff = 500,
                         .opening = 6000, .openingDecay = 0.08, .level = 0.5}},
        {Timbre::pad, {.unison = 5, .detuneCents = 16, .attack = 0.35, .decay = 1, .sustain = 0.9, .release = 0.8,
                       .cutoff = 900, .opening = 700, .openingDecay = 1.5, .level = 0.35}},
        {Timbre::lead, {.wave = Wave::square, .unison = 2, .detuneCents = 10, .attack = 0.01, .sustain = 0.8,
                        .cutoff = 3000, .opening = 3000, .vibratoCents = 12, .level = 0.35}},
        {Timbre::electricPiano, {.wave = Wave::fm, .decay = 1.2, .sustain = 0.2, .release = 0.15, .fmRatio = 1,
                                 .fmDepth = 1.6, .fmDecay = 0.35, .level = 0.4}},
        {Timbre::clavinet, {.wave = Wave::square, .decay = 0.4, .sustain = 0.1, .cutoff = 1200, .opening = 5000,
                            .openingDecay = 0.15, .quality = 2, .level = 0.35}},
        {Timbre::bell, {.wave = Wave::fm, .decay = 0.9, .sustain = 0, .release = 0.4, .fmRatio = 3.51,
                        .fmDepth = 2.4, .fmDecay = 0.6, .level = 0.5}},
        {Timbre::marimba, {.wave = Wave::fm, .decay = 0.16, .sustain = 0, .release = 0.1, .fmRatio = 3.93,
                           .fmDepth = 0.9, .fmDecay = 0.03, .level = 0.7}},
        {Timbre::koto, {.wave = Wave::string, .decay = 2, .sustain = 0.5, .release = 0.3, .level = 0.7}},
        {Timbre::voice, {.unison = 3, .detuneCents = 9, .attack = 0.12, .sustain = 0.9, .release = 0.25,
                         .vibratoCents = 18, .level = 0.5, .vowel = true}},
    };
    // clang-format on
    return voices.at(timbre);
}

double envelope(const Voice& voice, double time, double held) {
    const double rise = std::min(1.0, time / voice.attack);
    const double level = voice.sustain + (1 - voice.sustain) * decayed(time, voice.decay);
    const double fall = time > held ? decayed(time - held, voice.release / 4) : 1;
    return rise * level * fall;
}

double vibrato(const Voice& voice, double time) {
    return std::exp2(voice.vibratoCents / 1200 * std::sin(2 * std::numbers::pi * 5.4 * time));
}

void addUnison(Signal& signal, const Voice& voice, double hertz, int rate, int side) {
    Signal pitch(signal.size(), hertz);
    if (voice.vibratoCents > 0) {
        for (std::size_t i = 0; i < pitch.size(); ++i)
            pitch[i] *= vibrato(voice, static_cast<double>(i) / rate);
    }
    for (int i = 0; i < voice.unison; ++i) {
        const double spread = voice.unison == 1 ? 0 : 2.0 * i / (voice.unison - 1) - 1;
        const double detune = std::exp2(voice.detuneCents * (spread + 0.3 * side) / 1200);
        Oscillator oscillator(rate, 0.37 * i + (side > 0 ? 0.21 : 0.0));
        for (std::size_t k = 0; k < signal.size(); ++k) {
            const double bent = detune * pitch[k];
            signal[k] +=
                (voice.wave == Wave::saw ? oscillator.saw(bent) : oscillator.square(bent)) / voice.unison;
        }
    }
}

void addFrequencyModulation(Signal& signal, const Voice& voice, double hertz, int rate, int side) {
    const double turn = 2 * std::numbers::pi * hertz * std::exp2(3.0 * side / 1200);
    for (std::size_t i = 0; i < signal.size(); ++i) {
        const double time = static_cast<double>(i) / rate;
        const double depth = voice.fmDepth * decayed(time, voice.fmDecay);
        signal[i] += std::sin(turn * time + depth * std::sin(turn * voice.fmRatio * time));
    }
}

/// A plucked string: noise that runs round a delay line and loses its highs on the way (Karplus and Strong).
void addString(Signal& signal, double hertz, int rate, int side) {
    Noise noise(static_cast<std::uint32_t>(hertz) + static_cast<std::uint32_t>(side + 1));
    Signal line(static_cast<std::size_t>(std::lround(rate / hertz - 0.5)));
    for (double& sample : line) sample = noise.next();
    for (std::size_t i = 0; i < signal.size(); ++i) {
        double& sample = line[i % line.size()];
        signal[i] += sample;
        sample = 0.4985 * (sample + line[(i + 1) % line.size()]);
    }
}

void sweepFilter(Signal& signal, const Voice& voice, int rate) {
    constexpr std::size_t kControlFrames = 32;
    Filter filter(rate);
    for (std::size_t i = 0; i < signal.size(); ++i) {
        if (i % kControlFrames == 0) {
            const double time = static_cast<double>(i) / rate;
            filter.tune(voice.cutoff + voice.opening * decayed(time, voice.openingDecay), voice.quality);
        }
        filter.feed(signal[i]);
        signal[i] = filter.low();
    }
}

/// The three formants of an open "ah".
void shapeVowel(Signal& signal, int rate) {
    struct Formant {
        double hertz, level;
    };
    static constexpr std::array<Formant, 3> formants = {{{730, 1.0}, {1090, 0.6}, {2440, 0.25}}};
    Signal shaped(signal.size());
    for (const Formant& formant : formants) {
        Filter filter(rate);
        filter.tune(formant.hertz, 9);
        for (std::size_t i = 0; i < signal.size(); ++i) {
            filter.feed(signal[i]);
            shaped[i] += 0.35 * formant.level * filter.band();
        }
    }
    signal = shaped;
}

}  // namespace

Signal playNote(Timbre timbre, int key, double seconds, int rate, int side) {
    const Voice& voice = voiceOf(timbre);
    const double hertz = hertzOfKey(key);
    Signal signal(framesIn(seconds + voice.release, rate));
    switch (voice.wave) {
        case Wave::saw:
        case Wave::square:
            addUnison(signal, voice, hertz, rate, side);
            break;
        case Wave::fm:
            addFrequencyModulation(signal, voice, hertz, rate, side);
            break;
        case Wave::string:
            addString(signal, hertz, rate, side);
            break;
    }
    if (voice.vowel) shapeVowel(signal, rate);
    if (voice.wave != Wave::fm) sweepFilter(signal, voice, rate);
    for (std::size_t i = 0; i < signal.size(); ++i) {
        signal[i] *= voice.level * envelope(voice, static_cast<double>(i) / rate, seconds);
    }
    fadeOut(signal, rate, std::min(0.01, voice.release));
    return signal;
}

}  // namespace qvct::demo
