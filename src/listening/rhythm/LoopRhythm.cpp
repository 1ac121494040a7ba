#include "listening/rhythm/LoopRhythm.h"

#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "media/loopfile/LCFileData.h"
#include "media/midi/MidiSequence.h"

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

std::shared_ptr<QVCTMidiAnalysis> analysisOf(const std::vector<Note>& notes, const LoopMetre& metre) {
    auto analysis = QVCTMidiAnalysis::initWithTempo(metre.bpm, metre.beatCount, metre.signatureTop,
                                                    metre.signatureBottom);
    for (const Note& note : notes) analysis->addNote(note);
    return analysis;
}

}  // namespace qvct
