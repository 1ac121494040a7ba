#pragma once

#include "listening/rhythm/Note.h"

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

namespace qvct {

class LCFileData;
class MidiSequence;
struct Onset;
class QVCTMidiAnalysis;

/// Tempo, length and signature of a loop.
struct LoopMetre {
    float bpm = 0;
    std::int32_t beatCount = 0;
    std::int32_t signatureTop = 0;
    std::int32_t signatureBottom = 0;

    /// As the file says.
    static LoopMetre of(const LCFileData& data);
    /// Whether the rhythm of such a loop is graded: tempo, length and signature are known, and a bar has
    /// neither 5 nor 7 beats.
    bool isMeasured() const {
        return bpm != 0 && beatCount != 0 && signatureTop != 0 && signatureBottom != 0 && signatureTop != 5 &&
               signatureTop != 7;
    }
};

/// The notes by which a loop that holds MIDI is judged: those of its first track, on every channel. Their
/// times count in quarter notes, whatever the signature.
std::vector<Note> notesOfFirstTrack(const MidiSequence& sequence);

/// Onsets at sample-frame positions as notes of equal loudness, in single precision; none where a beat has no
/// frames. Their times count in beats of the loop.
std::vector<Note> notesOfOnsets(std::span<const std::int64_t> onsets, std::int64_t frames,
                                std::int32_t beatCount);

/// The same onsets as notes of unequal loudness: the loudest has the velocity 127, one that is half as loud
/// 64, and none less than 1.
std::vector<Note> accentedNotesOfOnsets(const std::vector<Onset>& onsets, std::int64_t frames,
                                        std::int32_t beatCount);

/// The analysis of a loop of these notes. The tagging service and everything else that grades a rhythm use
/// it.
std::shared_ptr<QVCTMidiAnalysis> analysisOf(const std::vector<Note>& notes, const LoopMetre& metre);

}  // namespace qvct
