#include "autotagging/services/QVCTRhythmicTaggingService.h"

#include "listening/rhythm/AudioTransientComplexity.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "media/loopfile/LCFileData.h"
#include "media/midi/MidiSequence.h"

#include <string>

namespace qvct {

TagDictionarySet QVCTRhythmicTaggingService::tagsForValues(float density, float complexity) {
    TagDictionarySet tags;
    tags.insert(tagDictionary("Rhythmic Density", density));
    tags.insert(tagDictionary("Rhythmic Complexity", complexity));
    return tags;
}

TagDictionarySet QVCTRhythmicTaggingService::tagsFromMidiIfExisting(const LCFileData& fileData) const {
    const auto sequence = MidiSequence::parse(fileData.midiData());
    if (!sequence) return {};
    const auto metre = LoopMetre::of(fileData);
    const auto notes = notesOfFirstTrack(*sequence);
    if (notes.empty() || !metre.isMeasured()) return {};
    const auto analysis = analysisOf(notes, metre);
    const float density = analysis->computeRhythmicDensity();
    return tagsForValues(density, analysis->computeRhythmicComplexity());
}

TagDictionarySet QVCTRhythmicTaggingService::tagsFromTransients(const URL& url,
                                                                const LCFileData& fileData) const {
    AudioTransientComplexity transients;
    if (!transients.computeRhythmicDensityAndComplexityUsingTransients(url, fileData, true)) return {};
    return tagsForValues(transients.getDensity(), transients.getComplexity());
}

TagDictionarySet QVCTRhythmicTaggingService::tagsWithContentsOfURL(
    const URL& url, const std::shared_ptr<QVCTXMLDocument>& /*xmlDocument*/,
    const std::shared_ptr<TGRTMetaData>& /*metaData*/, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    if (!fileData || (options & QVCTAutoTaggingOptionRhythm) == 0) return {};
    const int type = fileData->tavioLoopType();
    if (type < 0) return {};
    return type > 0 ? tagsFromMidiIfExisting(*fileData) : tagsFromTransients(url, *fileData);
}

}  // namespace qvct
