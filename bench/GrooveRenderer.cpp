#include "GrooveRenderer.h"

#include "media/audio/AudioDecoder.h"

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <numbers>
#include <random>

namespace qvct::bench {
namespace {

constexpr double kOneOnset = 0.030;  // seconds
constexpr double kLead = 0.25;       // silence before the first note
constexpr double kTau = 2 * std::numbers::pi;

// The file at kRate, mono, by linear interpolation; a kit's sounds need no better.
std::vector<float> loadSound(const std::string& path) {
    const auto decoder = AudioDecoder::open(path);
    if (!decoder) return {};
    const auto channels = static_cast<std::size_t>(decoder->channels());
    std::vector<float> frames(static_cast<std::size_t>(decoder->frames()) * channels);
    frames.resize(decoder->read(frames) * channels);
    const double step = double(decoder->sampleRate()) / kRate;
    std::vector<float> sound;
    for (double at = 0; (static_cast<std::size_t>(at) + 2) * channels <= frames.size(); at += step) {
        const auto i = static_cast<std::size_t>(at);
        const auto part = static_cast<float>(at - double(i));
        sound.push_back(frames[i * channels] * (1 - part) + frames[(i + 1) * channels] * part);
    }
    return sound;
}

double beatsToSeconds(const MidiSequence& groove, double beat) {
    double seconds = 0, from = 0, bpm = 120;
    for (const TempoChange& tempo : groove.tempos()) {
        if (tempo.beat >= beat) break;
        seconds += (tempo.beat - from) * 60 / bpm;
        from = tempo.beat;
        bpm = tempo.bpm;
    }
    return seconds + (beat - from) * 60 / bpm;
}

void mix(std::vector<float>& samples, const std::vector<float>& sound, double time, float gain) {
    const auto start = static_cast<std::size_t>(std::lround(time * kRate));
    for (std::size_t i = 0; i < sound.size() && start + i < samples.size(); ++i) {
        samples[start + i] += gain * sound[i];
    }
}

std::vector<float> bassNote(double hertz) {
    std::vector<float> note(static_cast<std::size_t>(0.4 * kRate));
    for (std::size_t i = 0; i < note.size(); ++i) {
        const double t = double(i) / kRate;
        const double envelope = std::min(1.0, t / 0.004) * std::exp(-4 * t) * std::min(1.0, (0.4 - t) / 0.05);
        note[i] = static_cast<float>(envelope *
                                     (std::sin(kTau * hertz * t) + 0.3 * std::sin(kTau * 2 * hertz * t)));
    }
    return note;
}

// Chords that swell in and out over two seconds, with a little vibrato: nothing in them is an onset.
void addPad(std::vector<float>& samples) {
    constexpr double kChord[] = {220, 277.2, 329.6, 440};
    for (std::size_t i = 0; i < samples.size(); ++i) {
        const double t = double(i) / kRate;
        double sum = 0;
        for (const double hertz : kChord) {
            for (int partial = 1; partial <= 5; ++partial) {
                sum +=
                    std::sin(kTau * hertz * partial * t + 0.5 * partial * std::sin(kTau * 5 * t)) / partial;
            }
        }
        samples[i] += static_cast<float>(0.01 * (1 - std::cos(kTau * t / 2)) * sum);
    }
}

void addNoise(std::vector<float>& samples, double decibels) {
    std::mt19937 random(1);
    std::normal_distribution<float> noise(0, static_cast<float>(std::pow(10, decibels / 20)));
    for (float& sample : samples) sample += noise(random);
}

// A diffuse tail of sparse random pulses ("velvet noise") that begins 5 ms after the sound.
void addRoom(std::vector<float>& samples, double seconds) {
    std::mt19937 random(2);
    std::vector<float> wet(samples.size());
    constexpr std::size_t kSpacing = kRate / 1000;
    for (std::size_t slot = kRate / 200; slot < static_cast<std::size_t>(seconds * kRate); slot += kSpacing) {
        const std::size_t delay = slot + random() % kSpacing;
        const double gain = 0.05 * std::pow(10, -3 * double(delay) / kRate / seconds);
        const auto signedGain = static_cast<float>(random() % 2 ? gain : -gain);
        for (std::size_t i = delay; i < samples.size(); ++i) wet[i] += signedGain * samples[i - delay];
    }
    for (std::size_t i = 0; i < samples.size(); ++i) samples[i] += wet[i];
}

std::vector<double> mergedOnsets(std::vector<double> times) {
    std::sort(times.begin(), times.end());
    std::vector<double> onsets;
    for (const double time : times) {
        if (onsets.empty() || time - onsets.back() > kOneOnset) onsets.push_back(time);
    }
    return onsets;
}

}  // namespace

std::optional<Kit> Kit::load(const std::string& folder) {
    // The first part of a file name that is found plays the sound; machines without it borrow the next best.
    static constexpr const char* kNames[kSoundCount][4] = {
        {"kick-accent", "kick.", "kick", ""},      {"snare-accent", "snare-m", "snare.", "snare"},
        {"rim", "stick-m", "clave", ""},           {"hihat-closed.", "hihat-closed", "hihat.", ""},
        {"hihat-open", "hihat-metal", "", ""},     {"tom-l.", "conga-l", "tom.", ""},
        {"tom-h.", "bongo-h", "tom.", ""},         {"crash", "cymball-long", "cymbal", ""},
        {"ride", "cymball-short", "tamb-long", ""}};
    std::vector<std::string> files;
    for (const auto& entry : std::filesystem::directory_iterator(folder))
        files.push_back(entry.path().string());
    std::sort(files.begin(), files.end());
    Kit kit;
    for (std::size_t sound = 0; sound < kSoundCount; ++sound) {
        for (const char* name : kNames[sound]) {
            const auto file = std::find_if(files.begin(), files.end(), [&](const std::string& path) {
                return *name && path.find(name, folder.size()) != std::string::npos;
            });
            if (file == files.end() || !kit.sounds_[sound].empty()) continue;
            kit.sounds_[sound] = loadSound(*file);
        }
    }
    if (kit.sounds_[kKick].empty() || kit.sounds_[kSnare].empty() || kit.sounds_[kClosedHat].empty())
        return {};
    return kit;
}

const std::vector<float>& Kit::soundFor(int pitch) const {
    switch (pitch) {
        case 35:
        case 36:
            return sounds_[kKick];
        case 37:
            return sounds_[kRim];
        case 22:
        case 42:
        case 44:
            return sounds_[kClosedHat];
        case 26:
        case 46:
            return sounds_[kOpenHat];
        case 41:
        case 43:
        case 45:
        case 58:
            return sounds_[kLowTom];
        case 47:
        case 48:
        case 50:
            return sounds_[kHighTom];
        case 49:
        case 52:
        case 55:
        case 57:
            return sounds_[kCrash];
        case 51:
        case 53:
        case 59:
            return sounds_[kRide];
        default:
            return sounds_[kSnare];
    }
}

Rendering render(const MidiSequence& groove, const Kit& kit, const Setting& setting, double seconds) {
    Rendering rendering;
    rendering.samples.assign(static_cast<std::size_t>((seconds + 1) * kRate), 0);
    const std::vector<float> bass = bassNote(55);
    std::vector<double> times;
    for (const MidiNote& note : groove.tracks().at(0).notes) {
        const double time = kLead + beatsToSeconds(groove, note.start) / setting.tempoFactor;
        if (time > seconds) continue;
        const auto gain = static_cast<float>(std::pow(note.velocity / 127.0, 1.5));
        mix(rendering.samples, kit.soundFor(note.pitch), time, 0.5F * gain);
        if (setting.bassAndPad && note.pitch == 36) mix(rendering.samples, bass, time, 0.2F);
        times.push_back(time);
    }
    rendering.onsets = mergedOnsets(times);
    const double end = rendering.onsets.empty() ? 0 : rendering.onsets.back() + 1;
    rendering.samples.resize(std::min(rendering.samples.size(), static_cast<std::size_t>(end * kRate)));
    if (setting.roomSeconds > 0) addRoom(rendering.samples, setting.roomSeconds);
    if (setting.bassAndPad) addPad(rendering.samples);
    if (setting.noiseDb < 0) addNoise(rendering.samples, setting.noiseDb);
    return rendering;
}

}  // namespace qvct::bench
