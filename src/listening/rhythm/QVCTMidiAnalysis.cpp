#include "listening/rhythm/QVCTMidiAnalysis.h"

#include "listening/rhythm/AgglomerativeClustering.h"
#include "listening/rhythm/FractalComplexity.h"
#include "listening/rhythm/MetricWeights.h"
#include "listening/rhythm/NoteLookup.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <limits>
#include <string>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr double kGrid = 0.125;  // beats

// The starting points of both curves: e^-3 and e^-2.2, each rounded to single precision.
constexpr double kDensityFloor = 0.049787066876888275;
constexpr double kComplexityFloor = 0.11080314964056015;
constexpr double kPerVelocity = 1.0 / 127;

bool hasNoMeasuredMetre(std::int32_t numerator) {
    return numerator == 5 || numerator == 7;
}

void quantise(Note& note) {
    const double remainder = std::fmod(note.startTime, kGrid);
    const double move = remainder > kGrid / 2 ? kGrid - remainder : -remainder;
    note.startTime += move;
    note.endTime += move;
}

// Odd multiples of 3 are cut into thirds, all else into halves, down to an eighth of a beat.
std::vector<std::int32_t> metricDivisions(std::int32_t beatCount) {
    std::vector<std::int32_t> divisions;
    float length = static_cast<float>(beatCount);
    do {
        const int beats = static_cast<int>(length);
        const bool inThirds = beats % 2 != 0 && beats % 3 == 0;
        divisions.push_back(inThirds ? 3 : 2);
        length *= inThirds ? 0.33333334F : 0.5F;
    } while (length > static_cast<float>(kGrid));
    return divisions;
}

}  // namespace

std::shared_ptr<QVCTMidiAnalysis> QVCTMidiAnalysis::initWithTempo(float bpm, std::int32_t beatCount,
                                                                  std::int32_t topTimeSig,
                                                                  std::int32_t bottomTimeSig) {
    return std::shared_ptr<QVCTMidiAnalysis>(new QVCTMidiAnalysis(bpm, beatCount, topTimeSig, bottomTimeSig));
}

void QVCTMidiAnalysis::printNotes() const {
    std::string text = fmt::format("\nbpm {:.5g}\nbeatCount {}\ntimeSigTop {}\ntimeSigBottom {}\n", bpm_,
                                   beatCount_, timeSigTop_, timeSigBottom_);
    for (const Note& note : notes_) {
        text +=
            fmt::format("{:.5g}\n{:.5g}\n{}\n{}\n", note.startTime, note.endTime, note.pitch, note.velocity);
    }
    std::fwrite(text.data(), 1, text.size(), stdout);
}

void QVCTMidiAnalysis::adjustNoteTimesToZero() {
    if (adjustedNoteTimes_ || notes_.empty()) return;
    adjustedNoteTimes_ = true;
    const float last = static_cast<float>(notes_.back().startTime);
    const float length = static_cast<float>(beatCount_);
    if (!std::isfinite(last) || length <= 0 || last < length) return;

    // Gives what subtracting the loop length again and again would give, in one step.
    const float shift = last - std::fmod(last, length);
    for (Note& note : notes_) {
        note.startTime -= static_cast<double>(shift);
        note.endTime -= static_cast<double>(shift);
    }
}

float QVCTMidiAnalysis::computeRhythmicDensity() {
    adjustNoteTimesToZero();
    const std::int64_t cells = std::int64_t{beatCount_} * (timeSigBottom_ == 4 ? 8 : 4);
    if (cells <= 0) return 0;

    const float width = static_cast<float>(beatCount_) / static_cast<float>(cells);
    std::vector<std::int64_t> hits;  // The cell starts are exact, so that a division finds the cell.
    for (const Note& note : notes_) {
        const double cell = std::floor(note.startTime / static_cast<double>(width));
        if (cell >= 0 && cell < static_cast<double>(cells)) hits.push_back(static_cast<std::int64_t>(cell));
    }
    std::sort(hits.begin(), hits.end());
    hits.erase(std::unique(hits.begin(), hits.end()), hits.end());

    const float share = static_cast<float>(hits.size()) / static_cast<float>(cells);
    const double curve = std::log(double{share} * (1 - kDensityFloor) + kDensityFloor) / 3 + 1;
    return std::clamp(static_cast<float>(curve), 0.0F, 1.0F);
}

std::vector<Note> QVCTMidiAnalysis::reducedNotes() const {
    AgglomerativeClustering clustering(notes_);
    clustering.setThreshold(kGrid);
    clustering.runAnalysis(AgglomerativeClustering::kStartInThreshold);
    std::vector<Note> reduced = clustering.getReducedRepresentationEarliestNotes();
    for (Note& note : reduced) quantise(note);
    return reduced;
}

float QVCTMidiAnalysis::selfDissimilarity(RhythmDetail& detail) const {
    detail.divisions = metricDivisions(beatCount_);
    const std::vector<double> resolutions(detail.divisions.size(), kGrid);
    const std::vector<float> weights(detail.divisions.size(), 1.0F);
    const float complexity = FractalComplexity().computeComplexity(detail.notes, beatCount_, detail.divisions,
                                                                   resolutions, weights, &detail.levelScores);

    constexpr double kPerDecade = 1.0 / static_cast<double>(2.2F);
    return static_cast<float>(
        std::log(double{complexity} * (1 - kComplexityFloor) + kComplexityFloor) * kPerDecade + 1);
}

float QVCTMidiAnalysis::syncopation(const std::vector<Note>& reduced) const {
    const std::vector<float> mask = getSyncopationMask();
    const std::int64_t cells = timeSigBottom_ == 0 ? 0 : std::int64_t{32 / timeSigBottom_} * beatCount_;
    if (cells <= 0 || mask.size() != static_cast<std::size_t>(cells)) {
        return std::numeric_limits<float>::quiet_NaN();
    }
    const NoteLookup lookup(reduced);
    float sum = 0;
    float count = 0;
    for (std::size_t i = 0; i < mask.size(); ++i) {
        const double from = static_cast<double>(i) * kGrid;
        if (const Note* note = lookup.firstIn(from, from + kGrid)) {
            sum += static_cast<float>(double{mask[i]} * kPerVelocity * note->velocity);
            count += 1;
        }
    }
    return (sum / count) * 0.4F - 0.2F;
}

float QVCTMidiAnalysis::computeRhythmicComplexity(RhythmDetail* detail) {
    RhythmDetail found;
    const float complexity = measureComplexity(found);
    if (detail) {
        if (complexity == 0) found.reasonForZero = reasonForZero(found);
        *detail = std::move(found);
    }
    return complexity;
}

float QVCTMidiAnalysis::measureComplexity(RhythmDetail& found) {
    if (notes_.empty()) return 0;
    adjustNoteTimesToZero();
    found.notes = reducedNotes();
    if (hasNoMeasuredMetre(timeSigTop_) || beatCount_ > kLongestLoop) return 0;

    found.selfDissimilarity = selfDissimilarity(found);
    found.syncopation = syncopation(found.notes);
    const float sum = found.selfDissimilarity + found.syncopation;
    return sum > 0 ? std::min(sum, 1.0F) : 0;  // A sum that is not a number is 0.
}

std::string QVCTMidiAnalysis::reasonForZero(const RhythmDetail& found) const {
    if (notes_.empty()) return "there are no notes";
    if (hasNoMeasuredMetre(timeSigTop_)) return fmt::format("bars of {} beats are not graded", timeSigTop_);
    if (beatCount_ > kLongestLoop) return fmt::format("it is longer than {} beats", kLongestLoop);
    const auto bar = metricWeightsOfBar(timeSigTop_, timeSigBottom_);
    if (bar.empty()) return fmt::format("bars of {} beats have no metric weights", timeSigTop_);
    if (beatCount_ < timeSigTop_ || beatCount_ % timeSigTop_ != 0)
        return fmt::format("{} beats are no whole bars of {}/{}", beatCount_, timeSigTop_, timeSigBottom_);
    if (timeSigBottom_ == 0 ||
        static_cast<std::int64_t>(bar.size()) != std::int64_t{32 / timeSigBottom_} * timeSigTop_)
        return fmt::format("bars of {}/{} have no metric weights", timeSigTop_, timeSigBottom_);
    if (std::isnan(found.selfDissimilarity))
        return fmt::format("{} beats do not divide into halves and thirds down to an eighth of a beat",
                           beatCount_);
    if (std::isnan(found.syncopation)) return "no note starts in a cell that has a metric weight";
    return "its parts are alike, and its notes are soft or on strong beats";
}

std::vector<float> QVCTMidiAnalysis::getSyncopationMask() const {
    const std::vector<float> bar = metricWeightsOfBar(timeSigTop_, timeSigBottom_);
    std::vector<float> mask;
    if (bar.empty() || beatCount_ > kLongestLoop) return mask;
    for (std::int32_t bars = beatCount_ / timeSigTop_; bars > 0; --bars) {
        for (const float weight : bar) mask.push_back(1 - weight);
    }
    return mask;
}

}  // namespace qvct
