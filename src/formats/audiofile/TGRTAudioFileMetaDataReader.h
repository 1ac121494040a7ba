#pragma once

#include "formats/TGRTBaseMetaDataReader.h"
#include "media/loopfile/LCFileData.h"

#include <memory>
#include <string_view>
#include <utility>

namespace qvct {

/// Reads the record inside a plain audio file: taggings, content info, display name, and the length as a key
/// value. Recorded previews of other content have none.
///
/// The loop reader extends it step by step; each step is given the file's data, which may be null.
/// @cost  Headers only: a few kilobytes of a file of any size.
class TGRTAudioFileMetaDataReader : public TGRTBaseMetaDataReader {
  public:
    static std::shared_ptr<TGRTAudioFileMetaDataReader> initWithTaxonomy(
        std::shared_ptr<TGRTTaxonomy> taxonomy) {
        return std::shared_ptr<TGRTAudioFileMetaDataReader>(
            new TGRTAudioFileMetaDataReader(std::move(taxonomy)));
    }
    static bool supportsFileExtension(std::string_view extension);

    std::shared_ptr<TGRTMetaData> readMetaDataFromURL(const URL& url, std::uint64_t options,
                                                      Error* error = nullptr) const override;
    std::shared_ptr<TGRTMetaData> readMetaDataFromFile(ItemFile& file, std::uint64_t options,
                                                       Error* error = nullptr) const override;
    std::int64_t defaultFileType() const override { return kFileTypeAudioFile; }

    virtual bool readSuccessForFileData(const std::shared_ptr<const LCFileData>& fileData,
                                        const URL& url) const;
    /// The sub type is set to -1 unless the file is a loop.
    virtual std::int64_t fileTypeFromFileData(const std::shared_ptr<const LCFileData>& fileData,
                                              const URL& url, std::int64_t& subType) const;
    virtual ObjectSet<TGRTKeyValue> readKeyValuesFromFileData(
        const std::shared_ptr<const LCFileData>& fileData, const URL& url) const;
    /// The taggings of an authored file; MetaDataReaderOptions are for loops.
    virtual ObjectSet<TGRTTagging> readTaggingsFromFileData(const std::shared_ptr<const LCFileData>& fileData,
                                                            std::uint64_t options, const URL& url) const;
    /// Never null.
    std::shared_ptr<TGRTContentInfo> readContentInfoFromFileData(
        const std::shared_ptr<const LCFileData>& fileData) const;

  protected:
    using TGRTBaseMetaDataReader::TGRTBaseMetaDataReader;
};

}  // namespace qvct
