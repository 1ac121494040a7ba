#include "operations/RhythmMeasurement.h"

#include "listening/onsets/OnsetDetector.h"
#include "listening/rhythm/LoopRhythm.h"
#include "media/audio/AudioDecoder.h"
#include "media/loopfile/LCFileData.h"
#include "media/midi/MidiSequence.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <cmath>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

constexpr double kUsualTempo = 120;

/// Tempo, length and signature, as far as they are known.
struct Metre {
    double tempo = 0;        // quarter notes a minute
    std::int32_t beats = 0;  // of the signature's lower number
    std::int32_t top = 0;
    std::int32_t bottom = 0;

    double beatsPerQuarter() const { return bottom / 4.0; }
    LoopMetre ofLoop() const { return {static_cast<float>(tempo), beats, top, bottom}; }
};

void applyRequest(const RhythmRequest& request, Metre& metre) {
    metre.tempo = request.tempo.value_or(metre.tempo);
    metre.beats = request.beats.value_or(metre.beats);
    metre.top = request.signatureTop.value_or(metre.top == 0 ? 4 : metre.top);
    metre.bottom = request.signatureBottom.value_or(metre.bottom == 0 ? 4 : metre.bottom);
}

/// Beats up to the end, rounded up to whole bars.
std::int32_t wholeBars(double quarters, const Metre& metre) {
    constexpr double tolerance = 1e-4;  // durations are in single precision
    const double bars = std::max(1.0, std::ceil(quarters * metre.beatsPerQuarter() / metre.top - tolerance));
    return static_cast<std::int32_t>(std::min(bars * metre.top, 1e9));
}

Metre metreOf(const LCFileData* data) {
    if (data == nullptr) return {};
    return {static_cast<double>(data->bpm()), data->beatCount(), data->signatureTop(),
            data->signatureBottom()};
}

/// What all tracks together give; nothing when no other than the first has notes.
std::optional<RhythmResult::AllTracks> measuredTogether(const MidiSequence& sequence, const Metre& metre) {
    RhythmResult::AllTracks all;
    std::vector<Note> notes;
    for (const MidiTrack& track : sequence.tracks()) {
        all.count += track.notes.empty() ? 0 : 1;
        for (const MidiNote& note : track.notes)
            notes.push_back({note.start, note.end(), note.pitch, note.velocity});
    }
    if (all.count < 2) return std::nullopt;
    std::stable_sort(notes.begin(), notes.end(),
                     [](const Note& a, const Note& b) { return a.startTime < b.startTime; });
    const auto analysis = analysisOf(notes, metre.ofLoop());
    all.density = analysis->computeRhythmicDensity();
    all.complexity = analysis->computeRhythmicComplexity();
    return all;
}

/// `beatsPerUnit` is what a unit of the notes' times is in beats.
std::optional<RhythmResult> measured(const URL& url, const std::vector<Note>& notes, double beatsPerUnit,
                                     const Metre& metre, Error* error) {
    if (metre.beats < 1 || metre.beats > kMostBeats) {
        fail(error, kErrorInvalidArgument,
             fmt::format("a loop of {} beats cannot be measured; 1 to {} can", metre.beats, kMostBeats),
             {url.path()});
        return std::nullopt;
    }
    if (notes.empty()) {
        fail(error, kErrorInvalidArgument, "nothing sounds in it", {url.path()});
        return std::nullopt;
    }
    const auto analysis = analysisOf(notes, metre.ofLoop());
    RhythmDetail detail;
    RhythmResult result;
    result.complexity = analysis->computeRhythmicComplexity(&detail);
    result.density = analysis->computeRhythmicDensity();
    result.reasonForZero = detail.reasonForZero;
    for (const Note& note : notes) result.onsets.push_back(note.startTime * beatsPerUnit);
    result.beatCount = metre.beats;
    result.tempo = metre.tempo;
    result.signatureTop = metre.top;
    result.signatureBottom = metre.bottom;

    RhythmPlot& plot = result.plot;
    plot.title = url.lastPathComponent();
    plot.tempo = metre.tempo;
    plot.beatCount = metre.beats;
    plot.signatureTop = metre.top;
    plot.signatureBottom = metre.bottom;
    plot.density = result.density;
    plot.complexity = result.complexity;
    plot.notes = analysis->notes();
    for (const Note& note : analysis->notes()) plot.onsets.push_back(note.startTime);
    plot.divisions = detail.divisions;
    plot.levelScores = detail.levelScores;
    for (const float weakness : analysis->getSyncopationMask()) plot.metricWeights.push_back(1 - weakness);
    return result;
}

std::optional<RhythmResult> measureMidi(const URL& url, const MidiSequence& sequence, Metre metre,
                                        const RhythmRequest& request, Error* error) {
    if (metre.tempo == 0)
        metre.tempo = sequence.tempos().empty() ? kUsualTempo : sequence.tempos().front().bpm;
    if (metre.top == 0 && !sequence.meters().empty()) {
        metre.top = sequence.meters().front().numerator;
        metre.bottom = sequence.meters().front().denominator;
    }
    applyRequest(request, metre);
    if (metre.beats == 0) metre.beats = wholeBars(sequence.endOfNotes(), metre);
    const auto notes = notesOfFirstTrack(sequence);
    if (notes.empty() && sequence.endOfNotes() > 0) {
        fail(error, kErrorInvalidArgument,
             "nothing sounds in its first track, which is the one that is measured", {url.path()});
        return std::nullopt;
    }
    if (notes.empty() && !sequence.problems().empty()) {
        std::vector<std::string> problems;
        for (const Error& problem : sequence.problems()) problems.push_back(problem.message());
        fail(error, kErrorInvalidArgument, "nothing sounds in it: " + join(problems, "; "), {url.path()});
        return std::nullopt;
    }
    auto result = measured(url, notes, metre.beatsPerQuarter(), metre, error);
    if (!result) return result;
    result->allTracks = measuredTogether(sequence, metre);
    result->problems = sequence.problems();
    return result;
}

std::unique_ptr<AudioDecoder> decoderOf(ItemFile& file, Error* error) {
    const auto reader = file.reader(error);
    return reader ? AudioDecoder::open(reader, file.url().path(), error) : nullptr;
}

/// The lowest and highest sample of equal slices of the file.
std::vector<RhythmPlot::Peak> waveformOf(ItemFile& file) {
    constexpr std::size_t slices = 1200;
    const auto decoder = decoderOf(file, nullptr);
    if (!decoder || decoder->frames() <= 0) return {};
    std::vector<RhythmPlot::Peak> peaks(slices);
    const auto channels = static_cast<std::size_t>(decoder->channels());
    const auto frames = static_cast<double>(decoder->frames());
    std::vector<float> block(4096 * channels);
    std::size_t frame = 0;
    for (std::size_t got = decoder->read(block); got > 0; got = decoder->read(block)) {
        for (std::size_t i = 0; i < got; ++i, ++frame) {
            const auto slice = static_cast<std::size_t>(static_cast<double>(frame) / frames * slices);
            RhythmPlot::Peak& peak = peaks[std::min(slice, slices - 1)];
            const float sample = std::clamp(block[i * channels], -1.0F, 1.0F);
            peak.low = std::min(peak.low, sample);
            peak.high = std::max(peak.high, sample);
        }
    }
    return peaks;
}

std::optional<RhythmResult> measureAudio(ItemFile& file, Metre metre, const RhythmRequest& request,
                                         Error* error) {
    const URL& url = file.url();
    const auto decoder = decoderOf(file, error);
    if (!decoder) return std::nullopt;
    const std::int64_t frames = decoder->frames();
    if (frames <= 0) {
        fail(error, kErrorInvalidArgument, "it has no samples", {url.path()});
        return std::nullopt;
    }
    const double minutes = static_cast<double>(frames) / decoder->sampleRate() / 60;
    applyRequest(request, metre);
    if (metre.beats == 0)
        metre.beats = static_cast<std::int32_t>(
            std::lround(std::min(metre.tempo * minutes * metre.beatsPerQuarter(), 1e6)));
    if (metre.beats == 0) {
        fail(error, kErrorInvalidArgument,
             metre.tempo > 0 ? "it is shorter than half a beat; say --beats"
                             : "its length in beats is unknown; say --beats or --tempo",
             {url.path()});
        return std::nullopt;
    }
    if (metre.tempo == 0) metre.tempo = metre.beats / minutes / metre.beatsPerQuarter();
    const auto onsets = OnsetDetector::detectWithLoudness(*decoder);
    auto result = measured(url, notesOfOnsets(framesOf(onsets), frames, metre.beats), 1, metre, error);
    if (!result) return result;
    const auto accented = accentedNotesOfOnsets(onsets, frames, metre.beats);
    result->accentedComplexity = analysisOf(accented, metre.ofLoop())->computeRhythmicComplexity();
    result->plot.waveform = waveformOf(file);
    return result;
}

}  // namespace

std::optional<RhythmResult> measureRhythm(ItemFile& file, const RhythmRequest& request, Error* error) {
    const URL& url = file.url();
    if (MidiSequence::supportsFileExtension(url.pathExtension())) {
        const auto sequence = MidiSequence::read(url.path(), error);
        return sequence ? measureMidi(url, *sequence, {}, request, error) : std::nullopt;
    }
    const auto data = file.audio();
    if (data && data->tavioLoopType() != 0 && !data->midiData().empty()) {
        const auto sequence = MidiSequence::parse(data->midiData());
        if (sequence && !sequence->tracks().empty()) {
            return measureMidi(url, *sequence, metreOf(data.get()), request, error);
        }
    }
    return measureAudio(file, metreOf(data.get()), request, error);
}

}  // namespace qvct::tool
