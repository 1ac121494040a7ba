#pragma once

#include "formats/ItemFile.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "output/pictures/RhythmPlot.h"
#include "platform/base/Error.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace qvct::tool {

/// No loop is longer; what claims to be is a mistake.
inline constexpr std::int32_t kMostBeats = QVCTMidiAnalysis::kLongestLoop;

/// What the user states; it takes precedence over what the file says.
struct RhythmRequest {
    std::optional<double> tempo;        ///< Quarter notes a minute.
    std::optional<std::int32_t> beats;  ///< In notes of the signature's lower number, like all beats here.
    std::optional<std::int32_t> signatureTop;
    std::optional<std::int32_t> signatureBottom;
};

struct RhythmResult {
    // What the tagging service gives a loop of these notes, tempo, length and signature.
    float density = 0;
    float complexity = 0;
    /// The complexity of a sound whose onsets are as loud as they are heard; nothing for MIDI.
    std::optional<float> accentedComplexity;
    std::string reasonForZero;   ///< Why the complexity is 0; empty where it is not.
    std::vector<double> onsets;  ///< Beats.
    std::int32_t beatCount = 0;
    double tempo = 0;  ///< Quarter notes a minute.
    std::int32_t signatureTop = 4;
    std::int32_t signatureBottom = 4;
    /// The same for the notes of all tracks together, if not only the first one has notes.
    struct AllTracks {
        std::size_t count = 0;  ///< Of the tracks with notes.
        float density = 0;
        float complexity = 0;
    };
    std::optional<AllTracks> allTracks;
    std::vector<Error> problems;  ///< What is damaged in the MIDI, and was left out.
    RhythmPlot plot;
};

/// Measures a MIDI file, a loop with MIDI inside, or any sound that can be decoded, as the tagging service
/// does: by the notes of the first track if there is MIDI, unless the file says that it is a loop of sound
/// only. What neither the request nor the file states is derived: the beats from tempo and length, the
/// signature as 4/4. Nothing, and an error, when the length in beats cannot be known or nothing sounds.
std::optional<RhythmResult> measureRhythm(ItemFile& file, const RhythmRequest& request, Error* error);

}  // namespace qvct::tool
