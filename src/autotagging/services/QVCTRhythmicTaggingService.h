#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>

namespace qvct {

/// Grades the rhythm of a loop: "Rhythmic Density" and "Rhythmic Complexity", each with a level in [0, 1].
///
/// A loop that holds MIDI is judged by the notes of its first track; a loop of sound, or audio that claims to
/// be one, by its onsets. Files that say that they are no loop get nothing, nor do loops without tempo,
/// length or signature, or with 5 or 7 beats to the bar. Stateless: safe from every thread.
class QVCTRhythmicTaggingService : public QVCTAutoTaggingService {
  public:
    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    std::string_view name() const override { return "rhythm"; }

    TagDictionarySet tagsFromMidiIfExisting(const LCFileData& fileData) const;
    /// Decodes the whole file.
    TagDictionarySet tagsFromTransients(const URL& url, const LCFileData& fileData) const;

    /// The two tags for two measured values.
    static TagDictionarySet tagsForValues(float density, float complexity);
};

}  // namespace qvct
