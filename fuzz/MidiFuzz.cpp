// Any bytes as a MIDI file: times ascend and are finite, notes lie within their track, levels are in [0, 1].
#include "ExactInput.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "media/midi/MidiSequence.h"

#include <cmath>

namespace {

using qvct::fuzz::require;

void measure(const qvct::MidiTrack& track, int beats, int top, int bottom) {
    const auto analysis = qvct::QVCTMidiAnalysis::initWithTempo(120, beats, top, bottom);
    for (const qvct::MidiNote& note : track.notes) {
        analysis->addNote({note.start, note.end(), note.pitch, note.velocity});
    }
    const float complexity = analysis->computeRhythmicComplexity();
    const float density = analysis->computeRhythmicDensity();
    require(complexity >= 0 && complexity <= 1 && density >= 0 && density <= 1);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const qvct::fuzz::ExactInput input(data, size);
    const auto sequence = qvct::MidiSequence::parse(input.bytes());
    if (!sequence) return 0;
    require(std::isfinite(sequence->length()));
    for (const qvct::MidiTrack& track : sequence->tracks()) {
        double last = 0;
        for (const qvct::MidiNote& note : track.notes) {
            require(note.start >= last && note.start <= track.length && note.duration >= 0);
            require(std::isfinite(note.end()) && note.pitch < 128 && note.velocity > 0 &&
                    note.velocity < 128);
            last = note.start;
        }
        measure(track, 16, 4, 4);
        const auto& meters = sequence->meters();
        if (!meters.empty()) measure(track, 12, meters[0].numerator, meters[0].denominator);
    }
    return 0;
}
