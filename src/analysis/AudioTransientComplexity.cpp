#include "analysis/AudioTransientComplexity.h"

#include "analysis/QVCTMidiAnalysis.h"
#include "platform/AudioDecoder.h"
#include "platform/LCFileParser.h"
#include "platform/OnsetDetector.h"

#include <string>
#include <vector>

namespace qvct {
namespace {

constexpr std::int32_t kPitch = 60;
constexpr std::int32_t kVelocity = 127;

// An editor's markers at the edges of a loop stand for the edges, not for sounds.
std::vector<std::int64_t> withoutEdges(std::vector<std::int64_t> markers, std::int64_t frames) {
    if (!markers.empty() && markers.back() == frames) markers.pop_back();
    if (!markers.empty() && markers.front() == 0) markers.erase(markers.begin());
    return markers;
}

}  // namespace

std::vector<Note> notesOfOnsets(std::span<const std::int64_t> onsets, std::int64_t frames,
                                std::int32_t beatCount) {
    std::vector<Note> notes;
    const std::int64_t framesPerBeat = beatCount == 0 ? 0 : frames / beatCount;
    if (framesPerBeat <= 0) return notes;
    const float beatsPerFrame = 1.0F / static_cast<float>(framesPerBeat);
    notes.reserve(onsets.size());
    for (const std::int64_t onset : onsets) {
        const double beat = static_cast<double>(static_cast<float>(onset) * beatsPerFrame);
        notes.push_back({beat, beat, kPitch, kVelocity});
    }
    return notes;
}

bool AudioTransientComplexity::computeRhythmicDensityAndComplexityUsingTransients(const URL& url,
                                                                                  bool withNewAnalysis) {
    if (alreadyComputed_) return true;
    const std::string extension = url.pathExtension();
    if (extension != "aif" && extension != "caf") return false;
    const auto data = LCFileParser::fileParserForURL(url)->enhancedFileData();
    if (!data) return false;
    const LoopMetre metre{data->bpm(), data->beatCount(), data->signatureTop(), data->signatureBottom()};
    if (!metre.isMeasured()) return false;

    const auto decoder = AudioDecoder::open(url.path());
    if (!decoder) return false;
    const std::int64_t frames = decoder->frames();
    return computeRhythmicDensityAndComplexity(
        withNewAnalysis ? OnsetDetector::detect(*decoder) : withoutEdges(data->transientMarkers(), frames),
        frames, metre);
}

bool AudioTransientComplexity::computeRhythmicDensityAndComplexity(std::span<const std::int64_t> onsets,
                                                                   std::int64_t frames,
                                                                   const LoopMetre& metre) {
    if (alreadyComputed_) return true;
    if (!metre.isMeasured()) return false;
    const std::vector<Note> notes = notesOfOnsets(onsets, frames, metre.beatCount);
    if (notes.empty()) return false;

    const auto analysis = QVCTMidiAnalysis::initWithTempo(metre.bpm, metre.beatCount, metre.signatureTop,
                                                          metre.signatureBottom);
    for (const Note& note : notes) analysis->addNote(note);
    complexity_ = analysis->computeRhythmicComplexity();
    density_ = analysis->computeRhythmicDensity();
    alreadyComputed_ = true;
    return true;
}

}  // namespace qvct
