// How well the notes of one-shots are told, on the sounds of `bench/render-notes`, and how long it takes.
// Usage: bench_note_accuracy FOLDER [all], which also lists the sounds that are told wrong
#include "Measure.h"
#include "RenderedSounds.h"
#include "listening/pitch/NotePitch.h"

#include <cmath>
#include <map>
#include <set>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

// Drawbar organs with a pipe an octave below the key, tubular bells, whose strike note is no partial, and
// guitar harmonics sound in other octaves than their key's, in some fonts and not in others.
const std::set<std::string> kOtherOctaves = {"14", "16", "17", "18", "31"};

struct Score {
    int sounds = 0, told = 0, note = 0, octave = 0, inTune = 0;

    void add(const std::optional<NotePitch>& pitch, double truth) {
        ++sounds;
        if (!pitch) return;
        ++told;
        const double off = pitch->note + pitch->cents / 100 - truth;
        const double folded = std::remainder(off, 12);
        note += std::abs(folded) < 0.5;
        octave += std::abs(off) < 0.5;
        inTune += std::abs(folded) <= 0.1;
    }
    static double share(int part, int whole) { return whole > 0 ? double(part) / whole : 0; }
};

void print(const std::string& name, const Score& score, const char* target) {
    printRow(name,
             fmt::format("note {:.3f}, octave {:.3f}", Score::share(score.note, score.sounds),
                         Score::share(score.octave, score.sounds)),
             target);
    printRow(fmt::format("  of {}: told, and right where told", score.sounds),
             fmt::format("{:.3f}, note {:.3f}, octave {:.3f}", Score::share(score.told, score.sounds),
                         Score::share(score.note, score.told), Score::share(score.octave, score.told)),
             "");
    printRow("  within 10 cents of the font's nominal pitch, where the note is right",
             fmt::format("{:.3f}", Score::share(score.inTune, score.note)), "");
}

void measure(const std::string& folder, bool listsAll) {
    NotePitchDetector detector;
    std::map<std::string, Score> scores;
    Score sameOctave;
    std::vector<double> times;
    for (const RenderedSound& sound : soundsOrExit(folder)) {
        const SoundExcerpt excerpt = sound.excerpt(10);
        std::optional<NotePitch> pitch;
        times.push_back(medianSeconds([&] { pitch = detector.pitchOf(excerpt.mono(), excerpt.sampleRate()); },
                                      3, clockTime));
        const double truth = std::atof(sound.truth.c_str());
        Score one;
        one.add(pitch, truth);
        scores[sound.kind].add(pitch, truth);
        if (sound.kind == "pitched" && kOtherOctaves.count(sound.number) == 0) sameOctave.add(pitch, truth);
        const bool isWrong =
            sound.kind == "unpitched" ? pitch.has_value() : sound.kind == "pitched" && !one.octave;
        if (listsAll && isWrong)
            fmt::print(
                "{} {} {}: {}\n", sound.path, sound.kind, sound.truth,
                pitch ? fmt::format("{:.2f} by {:.2f}", pitch->note + pitch->cents / 100, pitch->confidence)
                      : "nothing");
    }
    print("notes of pitched instruments", scores["pitched"], "note 0.97, octave 0.95");
    print("  without programs of other octaves (15, 17-19, 32)", sameOctave, "");
    print("  programs of chords, sweeps and echoes", scores["effect"], "");
    for (const char* kind : {"unpitched", "tuned drum"})
        printRow(fmt::format("{}: a note is claimed of", kind),
                 fmt::format("{} of {}", scores[kind].told, scores[kind].sounds),
                 kind == std::string("unpitched") ? "none" : "");
    printRow("time of a one-shot", fmt::format("{:.0f} µs", medianOf(times) * 1e6), "under 150 µs");
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    if (count < 2) return 1;
    qvct::bench::measure(arguments[1], count > 2);
}
