#include "listening/rhythm/AudioTransientComplexity.h"

#include "listening/onsets/OnsetDetector.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "media/audio/AudioDecoder.h"
#include "media/loopfile/LCFileParser.h"
#include "platform/files/reading/RandomAccessReader.h"

#include <string>
#include <vector>

namespace qvct {
namespace {

// An editor's markers at the edges of a loop stand for the edges, not for sounds.
std::vector<std::int64_t> withoutEdges(std::vector<std::int64_t> markers, std::int64_t frames) {
    if (!markers.empty() && markers.back() == frames) markers.pop_back();
    if (!markers.empty() && markers.front() == 0) markers.erase(markers.begin());
    return markers;
}

bool isMeasured(const URL& url) {
    const std::string extension = url.pathExtension();
    return extension == "aif" || extension == "caf";
}

}  // namespace

bool AudioTransientComplexity::computeRhythmicDensityAndComplexityUsingTransients(const URL& url,
                                                                                  bool withNewAnalysis) {
    if (alreadyComputed_) return true;
    if (!isMeasured(url)) return false;
    const auto file = FileReader::open(url.path());
    if (!file) return false;
    const auto data = LCFileParser::fileParserForReader(file, url.path())->enhancedFileData();
    return data && computeRhythmicDensityAndComplexityUsingTransients(url, *data, withNewAnalysis);
}

bool AudioTransientComplexity::computeRhythmicDensityAndComplexityUsingTransients(const URL& url,
                                                                                  const LCFileData& data,
                                                                                  bool withNewAnalysis) {
    if (alreadyComputed_) return true;
    const auto metre = LoopMetre::of(data);
    if (!isMeasured(url) || !metre.isMeasured()) return false;
    const auto file = data.openFile();
    const auto decoder = file ? AudioDecoder::open(file, url.path()) : AudioDecoder::open(url.path());
    if (!decoder) return false;
    const std::int64_t frames = decoder->frames();
    return computeRhythmicDensityAndComplexity(
        withNewAnalysis ? OnsetDetector::detect(*decoder) : withoutEdges(data.transientMarkers(), frames),
        frames, metre);
}

bool AudioTransientComplexity::computeRhythmicDensityAndComplexity(std::span<const std::int64_t> onsets,
                                                                   std::int64_t frames,
                                                                   const LoopMetre& metre) {
    if (alreadyComputed_) return true;
    if (!metre.isMeasured()) return false;
    const std::vector<Note> notes = notesOfOnsets(onsets, frames, metre.beatCount);
    if (notes.empty()) return false;

    const auto analysis = analysisOf(notes, metre);
    complexity_ = analysis->computeRhythmicComplexity();
    density_ = analysis->computeRhythmicDensity();
    alreadyComputed_ = true;
    return true;
}

}  // namespace qvct
