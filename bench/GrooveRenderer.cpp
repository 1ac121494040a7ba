#include "GrooveRenderer.h"

#include "Effects.h"
#include "SynthSounds.h"

#include <algorithm>
#include <cmath>
#include <random>

namespace qvct::bench {
namespace {

constexpr double kOneOnset = 0.030;  // seconds

constexpr double kForever = 1e9;

/// Mixes a sound so that its attack comes at a time, `speed` times as fast, faded out from `end` on.
void mix(std::vector<float>& samples, const Sound& sound, double time, float gain, double speed = 1,
         double end = kForever) {
    constexpr double kFade = 0.015;
    const auto start = std::lround(time * kRate - double(sound.attack) / speed);
    for (std::size_t i = 0;; ++i) {
        const double at = double(i) * speed;
        const auto from = static_cast<std::size_t>(at);
        const long to = start + static_cast<long>(i);
        if (from + 1 >= sound.samples.size() || to >= static_cast<long>(samples.size())) return;
        if (to < 0) continue;
        const auto part = static_cast<float>(at - double(from));
        const float sample = sound.samples[from] * (1 - part) + sound.samples[from + 1] * part;
        const double left = 1 - (double(to) / kRate - end) / kFade;
        if (left <= 0) return;
        samples[static_cast<std::size_t>(to)] += gain * sample * static_cast<float>(std::min(left, 1.0));
    }
}

struct TimedNote {
    double time;
    int pitch, velocity;
};

std::vector<TimedNote> playedNotes(const MidiSequence& groove, const Setting& setting, double seconds) {
    std::vector<TimedNote> notes;
    for (const MidiNote& note : groove.tracks().at(0).notes) {
        const double time = kLead + beatsToSeconds(groove, note.start) / setting.tempoFactor;
        if (time <= seconds) notes.push_back({time, note.pitch, note.velocity});
    }
    std::stable_sort(notes.begin(), notes.end(),
                     [](const TimedNote& a, const TimedNote& b) { return a.time < b.time; });
    return notes;
}

bool isHat(int pitch) {
    return pitch == 22 || pitch == 26 || pitch == 42 || pitch == 44 || pitch == 46;
}

// A crash with each fourth kick, and softer strokes on a ride for those on the hi-hat.
std::vector<TimedNote> washed(const std::vector<TimedNote>& notes) {
    constexpr int kKick = 36, kCrash = 49, kRide = 51;
    std::vector<TimedNote> result;
    int kicks = 0;
    for (TimedNote note : notes) {
        if (isHat(note.pitch)) note.pitch = kRide;
        result.push_back(note);
        if (note.pitch == kKick && kicks++ % 4 == 0) result.push_back({note.time, kCrash, note.velocity});
    }
    return result;
}

void playDrums(const std::vector<TimedNote>& notes, const Kit& kit, std::vector<float>& samples) {
    for (std::size_t i = 0; i < notes.size(); ++i) {
        const TimedNote& note = notes[i];
        const Stroke stroke = kit.strokeFor(note.pitch, note.velocity, i);
        if (!stroke.sound) continue;
        const auto next = std::find_if(
            notes.begin() + static_cast<std::ptrdiff_t>(i) + 1, notes.end(), [&](const TimedNote& later) {
                return later.time > note.time && kit.chokes(later.pitch, note.pitch);
            });
        mix(samples, *stroke.sound, note.time, stroke.gain, 1, next == notes.end() ? kForever : next->time);
    }
}

std::vector<TimedNote> melodyOf(const std::vector<TimedNote>& notes) {
    constexpr int kSoftest = 50;
    constexpr double kShortest = 0.1;
    std::vector<TimedNote> melody;
    for (const TimedNote& note : notes) {
        if (note.velocity < kSoftest) continue;
        if (melody.empty() || note.time - melody.back().time > kShortest) melody.push_back(note);
    }
    return melody;
}

void playMelody(const std::vector<TimedNote>& notes, const std::vector<Sound>& sounds,
                std::vector<float>& samples) {
    std::mt19937 random(static_cast<unsigned>(notes.size()));
    std::uniform_real_distribution<double> cents(-50, 50);
    for (std::size_t i = 0; i < notes.size(); ++i) {
        const Sound& sound = sounds[random() % sounds.size()];
        const double end = i + 1 < notes.size() ? notes[i + 1].time : kForever;
        const auto gain = static_cast<float>(0.5 * std::pow(notes[i].velocity / 127.0, 1.5));
        mix(samples, sound, notes[i].time, gain, std::exp2(cents(random) / 1200), end);
    }
}

std::vector<double> mergedOnsets(const std::vector<TimedNote>& notes) {
    std::vector<double> onsets;
    for (const TimedNote& note : notes) {
        if (onsets.empty() || note.time - onsets.back() > kOneOnset) onsets.push_back(note.time);
    }
    return onsets;
}

void change(std::vector<float>& samples, const Setting& setting) {
    if (setting.roomSeconds > 0) addRoom(samples, setting.roomSeconds);
    if (setting.bassAndPad) addPad(samples);
    if (setting.whiteDb < 0) addWhiteNoise(samples, setting.whiteDb);
    if (setting.pinkDb < 0) addPinkNoise(samples, setting.pinkDb);
    if (setting.lowPassHertz > 0) lowPass(samples, setting.lowPassHertz);
}

}  // namespace

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

Rendering render(const MidiSequence& groove, const Band& band, const Setting& setting, double seconds) {
    Rendering rendering;
    rendering.samples.assign(static_cast<std::size_t>((seconds + 1) * kRate), 0);
    std::vector<TimedNote> notes = playedNotes(groove, setting, seconds);
    if (setting.player == Setting::kMelody) {
        notes = melodyOf(notes);
        playMelody(notes, *band.notes, rendering.samples);
    } else {
        playDrums(setting.wash ? washed(notes) : notes, *band.kit, rendering.samples);
    }
    if (setting.bassAndPad) {
        const Sound bass = bassNote(55);
        for (const TimedNote& note : notes)
            if (note.pitch == 36) mix(rendering.samples, bass, note.time, 0.2F);
    }
    rendering.onsets = mergedOnsets(notes);
    const double tail = setting.cutSeconds > 0 ? setting.cutSeconds : 1;
    const double end = rendering.onsets.empty() ? 0 : rendering.onsets.back() + tail;
    rendering.samples.resize(std::min(rendering.samples.size(), static_cast<std::size_t>(end * kRate)));
    change(rendering.samples, setting);
    return rendering;
}

}  // namespace qvct::bench
