#include "analysis/AudioTransientComplexity.h"

#include "analysis/QVCTMidiAnalysis.h"

namespace qvct {
namespace {

constexpr std::int32_t kPitch = 60;
constexpr std::int32_t kVelocity = 127;

}  // namespace

bool AudioTransientComplexity::computeRhythmicDensityAndComplexity(std::span<const std::int64_t> onsets,
                                                                   std::int64_t frames,
                                                                   const LoopMetre& metre) {
    if (alreadyComputed_) return true;
    if (!metre.isMeasured()) return false;
    const std::int64_t framesPerBeat = frames / metre.beatCount;
    if (framesPerBeat <= 0 || onsets.empty()) return false;

    const auto analysis = QVCTMidiAnalysis::initWithTempo(metre.bpm, metre.beatCount, metre.signatureTop,
                                                          metre.signatureBottom);
    const float beatsPerFrame = 1.0F / static_cast<float>(framesPerBeat);
    for (const std::int64_t onset : onsets) {
        const double beat = static_cast<double>(static_cast<float>(onset) * beatsPerFrame);
        analysis->addNote({beat, beat, kPitch, kVelocity});
    }
    complexity_ = analysis->computeRhythmicComplexity();
    density_ = analysis->computeRhythmicDensity();
    alreadyComputed_ = true;
    return true;
}

}  // namespace qvct
