#include "demo/synthesis/Recipes.h"

#include "demo/synthesis/Grooves.h"

#include <algorithm>
#include <cmath>
#include <numbers>
#include <string>

namespace qvct::demo {
namespace {

constexpr std::size_t kStepsPerBeat = 4;
constexpr double kPeak = 0.9;

/// The channels of a sound in the making.
class Mix {
  public:
    Mix(const AudioFormat& format, double seconds)
        : format_(format),
          frames_(framesIn(seconds, format.rate)),
          samples_(frames_ * static_cast<std::size_t>(format.channels)) {}

    /// Adds to one channel; what reaches past the end goes on at the start.
    void add(const Signal& signal, double seconds, double gain, int channel) {
        std::size_t frame = framesIn(seconds, format_.rate) % frames_;
        const auto step = static_cast<std::size_t>(format_.channels);
        for (const double sample : signal) {
            samples_[frame * step + static_cast<std::size_t>(channel)] += gain * sample;
            if (++frame == frames_) frame = 0;
        }
    }

    void addPanned(const Signal& signal, double seconds, double gain, double pan) {
        if (format_.channels == 1) return add(signal, seconds, gain, 0);
        add(signal, seconds, gain * std::min(1.0, 1 - pan), 0);
        add(signal, seconds, gain * std::min(1.0, 1 + pan), 1);
    }

    void addNote(Timbre timbre, int key, double seconds, double held, double gain) {
        for (int channel = 0; channel < format_.channels; ++channel) {
            const int side = format_.channels == 1 ? 0 : 2 * channel - 1;
            add(playNote(timbre, key, held, format_.rate, side), seconds, gain, channel);
        }
    }

    Sound sound() const {
        double peak = 1e-9;
        for (const double sample : samples_) peak = std::max(peak, std::abs(sample));
        Sound result{.channels = format_.channels, .rate = format_.rate, .bits = format_.bits};
        result.samples.reserve(samples_.size());
        for (const double sample : samples_)
            result.samples.push_back(static_cast<float>(kPeak * sample / peak));
        return result;
    }

  private:
    AudioFormat format_;
    std::size_t frames_;
    Signal samples_;
};

std::string withoutBlanks(std::string_view steps) {
    std::string result(steps);
    std::erase(result, ' ');
    return result;
}

double gainOf(char step) {
    switch (step) {
        case 'X':
            return 1;
        case 'x':
            return 0.75;
        case 'o':
            return 0.35;
        default:
            return 0;
    }
}

std::size_t stepsIn(int beats) {
    return static_cast<std::size_t>(beats) * kStepsPerBeat;
}

double beatOfStep(std::size_t step, double swing) {
    const double late = step % 2 == 0 ? 0 : 2 * swing / 100 - 1;
    return (static_cast<double>(step) + late) / kStepsPerBeat;
}

/// How far a degree of the scale (from 1) lies above its tonic, in semitones.
int semitonesOf(int degree, Mode mode) {
    static constexpr std::array<int, 7> major = {0, 2, 4, 5, 7, 9, 11};
    static constexpr std::array<int, 7> minor = {0, 2, 3, 5, 7, 8, 10};
    const auto index = static_cast<std::size_t>((degree - 1) % 7);
    return (mode == Mode::minor ? minor.at(index) : major.at(index)) + 12 * ((degree - 1) / 7);
}

/// The notes of a phrase, each held until the next begins or a rest comes, but for a small gap.
std::vector<Note> notesOf(const SynthLoop& loop) {
    constexpr double kHeld = 0.9;
    const Phrase& melody = phrase(loop.phrase);
    const std::string steps = withoutBlanks(melody.steps);
    const std::size_t count = stepsIn(loop.bars * 4);
    const int highestThird = melody.chords ? 6 : 0;
    std::vector<Note> notes;
    for (std::size_t step = 0; step < count; ++step) {
        const char character = steps[step % steps.size()];
        if (character < '1' || character > '9') continue;
        std::size_t end = step + 1;
        while (end < count && steps[end % steps.size()] == '-') ++end;
        const double start = beatOfStep(step, melody.swing);
        const double length = kHeld * (beatOfStep(end, melody.swing) - start);
        for (int third = 0; third <= highestThird; third += 2) {
            const int key = loop.key + semitonesOf(character - '0' + third, loop.mode);
            notes.push_back({.start = start, .length = length, .key = key});
        }
    }
    return notes;
}

/// A marker where each bar begins.
void describeLoop(Sound& sound, double tempo, int bars, int beatsPerBar) {
    sound.loop = LoopFacts{.tempo = tempo, .beats = bars * beatsPerBar, .meterTop = beatsPerBar};
    for (int bar = 0; bar < bars; ++bar) {
        const std::size_t frame = framesIn(bar * beatsPerBar * 60 / tempo, sound.rate);
        sound.markers.push_back({static_cast<std::uint32_t>(frame), "Bar " + std::to_string(bar + 1)});
    }
}

struct Renderer {
    AudioFormat format;

    Sound operator()(const DrumHit& hit) const {
        Signal signal = drumHit(hit.drum, hit.kit, format.rate);
        if (hit.reversed) std::reverse(signal.begin(), signal.end());
        Mix mix(format, static_cast<double>(signal.size()) / format.rate);
        mix.addPanned(signal, 0, 1, 0);
        return mix.sound();
    }

    Sound operator()(const DrumLoop& loop) const {
        const Groove& pattern = groove(loop.groove);
        const int beats = loop.bars * pattern.beatsPerBar;
        Mix mix(format, beats * 60 / loop.tempo);
        for (const DrumLane& lane : pattern.lanes) {
            const Signal hit = drumHit(lane.drum, loop.kit, format.rate);
            const std::string steps = withoutBlanks(lane.steps);
            for (std::size_t step = 0; step < stepsIn(beats); ++step) {
                const double gain = gainOf(steps[step % steps.size()]);
                if (gain > 0)
                    mix.addPanned(hit, beatOfStep(step, pattern.swing) * 60 / loop.tempo, gain, lane.pan);
            }
        }
        Sound sound = mix.sound();
        describeLoop(sound, loop.tempo, loop.bars, pattern.beatsPerBar);
        return sound;
    }

    Sound operator()(const SynthNote& recipe) const {
        Mix mix(format, recipe.seconds + 0.5);
        mix.addNote(recipe.timbre, recipe.key, 0, recipe.seconds, 1);
        if (recipe.chord != Mode::none) {
            for (const int degree : {3, 5, 8}) {
                mix.addNote(recipe.timbre, recipe.key + semitonesOf(degree, recipe.chord), 0, recipe.seconds,
                            0.8);
            }
        }
        Sound sound = mix.sound();
        sound.rootNote = recipe.key;
        sound.mode = recipe.chord;
        return sound;
    }

    Sound operator()(const SynthLoop& loop) const {
        const double secondsPerBeat = 60 / loop.tempo;
        const std::vector<Note> notes = notesOf(loop);
        Mix mix(format, loop.bars * 4 * secondsPerBeat);
        for (const Note& note : notes) {
            mix.addNote(loop.timbre, note.key, note.start * secondsPerBeat, note.length * secondsPerBeat, 1);
        }
        Sound sound = mix.sound();
        sound.rootNote = loop.key;
        sound.mode = loop.mode;
        sound.notes = notes;
        describeLoop(sound, loop.tempo, loop.bars, 4);
        return sound;
    }

    Sound operator()(const Riser& riser) const {
        const double seconds = riser.beats * 60 / riser.tempo;
        Mix mix(format, seconds);
        for (int channel = 0; channel < format.channels; ++channel) {
            mix.add(climb(seconds, static_cast<std::uint32_t>(channel)), 0, 1, channel);
        }
        return mix.sound();
    }

    Signal climb(double seconds, std::uint32_t seed) const {
        Signal signal(framesIn(seconds, format.rate));
        Noise noise(seed + 7);
        Filter filter(format.rate);
        Oscillator tone(format.rate, 0);
        for (std::size_t i = 0; i < signal.size(); ++i) {
            const double progress = static_cast<double>(i) / static_cast<double>(signal.size());
            filter.tune(200 * std::exp2(6 * progress), 2);
            filter.feed(noise.next() + 0.4 * tone.saw(55 * std::exp2(3 * progress)));
            signal[i] = progress * progress * filter.band();
        }
        fadeOut(signal, format.rate, 0.02);
        return signal;
    }
};

}  // namespace

Sound render(const Recipe& recipe, const AudioFormat& format) {
    return std::visit(Renderer{format}, recipe);
}

}  // namespace qvct::demo
