#pragma once

#include "formats/audiofile/TGRTAudioFileMetaDataReader.h"

#include <memory>
#include <set>
#include <string>
#include <string_view>

namespace qvct {

/// Reads loops, and plain audio files as its base does: a loop's record also has its musical properties as
/// key values, and on demand the keywords of older loops as taggings.
class TGRTTavioLoopMetaDataReader : public TGRTAudioFileMetaDataReader {
  public:
    using Keywords = std::set<std::string>;

    static std::shared_ptr<TGRTTavioLoopMetaDataReader> initWithTaxonomy(
        std::shared_ptr<TGRTTaxonomy> taxonomy) {
        return std::shared_ptr<TGRTTavioLoopMetaDataReader>(
            new TGRTTavioLoopMetaDataReader(std::move(taxonomy)));
    }
    static bool supportsFileExtension(std::string_view extension);

    /// Whether the file is both authored and says that it is a loop.
    bool isTavioLoopFromFileData(const std::shared_ptr<const LCFileData>& fileData) const;

    std::int64_t fileTypeFromFileData(const std::shared_ptr<const LCFileData>& fileData, const URL& url,
                                      std::int64_t& subType) const override;
    ObjectSet<TGRTKeyValue> readKeyValuesFromFileData(const std::shared_ptr<const LCFileData>& fileData,
                                                      const URL& url) const override;
    ObjectSet<TGRTTagging> readTaggingsFromFileData(const std::shared_ptr<const LCFileData>& fileData,
                                                    std::uint64_t options, const URL& url) const override;

    /// Descriptors, instrument, its kind, and genre of an authored file, as older loops name them.
    Keywords legacyKeywordsForFileData(const std::shared_ptr<const LCFileData>& fileData) const;
    /// The tags of the retired loop vocabulary; keywords that it does not know are dropped.
    ObjectSet<TGRTTag> tagsForLegacyKeywords(const Keywords& keywords) const;
    /// Those tags as taggings without level. Takes keywords, whatever its name says.
    ObjectSet<TGRTTagging> taggingsForLegacyTags(const Keywords& keywords) const;
    ObjectSet<TGRTTagging> legacyFormatTaggingsForFileData(
        const std::shared_ptr<const LCFileData>& fileData) const;
    /// What those tags have become in the default taxonomy.
    ObjectSet<TGRTTagging> mappedTaggingsForLegacyKeywords(const Keywords& keywords) const;
    ObjectSet<TGRTTagging> mappedTaggingsForFileData(const std::shared_ptr<const LCFileData>& fileData) const;

  protected:
    using TGRTAudioFileMetaDataReader::TGRTAudioFileMetaDataReader;
};

}  // namespace qvct
