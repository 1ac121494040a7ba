#include "listening/rhythm/LoopRhythm.h"

#include "listening/onsets/OnsetDetector.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "media/loopfile/LCFileData.h"
#include "media/midi/MidiSequence.h"

#include <algorithm>
#include <cmath>

namespace qvct {

LoopMetre LoopMetre::of(const LCFileData& data) {
    return {data.bpm(), data.beatCount(), data.signatureTop(), data.signatureBottom()};
}

std::vector<Note> notesOfFirstTrack(const MidiSequence& sequence) {
    std::vector<Note> notes;
    if (sequence.tracks().empty()) return notes;
    for (const MidiNote& note : sequence.tracks().front().notes)
        notes.push_back({note.start, note.end(), note.pitch, note.velocity});
    return notes;
}

std::vector<Note> notesOfOnsets(std::span<const std::int64_t> onsets, std::int64_t frames,
                                std::int32_t beatCount) {
    constexpr std::int32_t pitch = 60;
    constexpr std::int32_t velocity = 127;
    std::vector<Note> notes;
    const std::int64_t framesPerBeat = beatCount == 0 ? 0 : frames / beatCount;
    if (framesPerBeat <= 0) return notes;
    const float beatsPerFrame = 1.0F / static_cast<float>(framesPerBeat);
    notes.reserve(onsets.size());
    for (const std::int64_t onset : onsets) {
        const double beat = static_cast<double>(static_cast<float>(onset) * beatsPerFrame);
        notes.push_back({beat, beat, pitch, velocity});
    }
    return notes;
}

std::vector<Note> accentedNotesOfOnsets(const std::vector<Onset>& onsets, std::int64_t frames,
                                        std::int32_t beatCount) {
    float loudest = 0;
    for (const Onset& onset : onsets) loudest = std::max(loudest, onset.loudness);
    std::vector<Note> notes = notesOfOnsets(framesOf(onsets), frames, beatCount);
    for (std::size_t i = 0; i < notes.size() && loudest > 0; ++i) {
        const auto velocity = static_cast<std::int32_t>(std::lround(127 * onsets[i].loudness / loudest));
        notes[i].velocity = std::max(1, velocity);
    }
    return notes;
}

std::shared_ptr<QVCTMidiAnalysis> analysisOf(const std::vector<Note>& notes, const LoopMetre& metre) {
    auto analysis = QVCTMidiAnalysis::initWithTempo(metre.bpm, metre.beatCount, metre.signatureTop,
                                                    metre.signatureBottom);
    for (const Note& note : notes) analysis->addNote(note);
    return analysis;
}

}  // namespace qvct
