#pragma once

#include "formats/BaseTypeValidator.h"
#include "formats/audiofile/TGRTAudioFileMetaDataReader.h"
#include "formats/audiofile/TGRTAudioFileWriters.h"
#include "formats/audiofile/TGRTTavioLoopMetaDataReader.h"

#include <optional>

namespace qvct {

/// Any file that the loop-file library can read is audio, whatever its extension, unless it is the recorded
/// preview of other content.
class TGRTAudioFileTypeValidator
    : public TypeValidatorFor<BaseTypeValidator, TGRTAudioFileMetaDataReader, TGRTAudioFileTaggingWriter,
                              TGRTAudioFileContentInfoWriter, TGRTAudioFileMetaDataWriter> {
  public:
    /// Whether the path, in whatever case, is that of a preview: of a settings file or preset beside it, or
    /// of the patch around it.
    static bool isPrelistenFile(const URL& url);

    bool isValidContentTypeAtFileURL(const URL& url) const override;
    /// The same for every URL: it can be prelistened and inserted on a track.
    unsigned itemActionsForFileURL(const URL& /*url*/) const override {
        return kItemCanPrelisten | kItemInsertableOnTrack;
    }
    /// The valid URL itself.
    std::optional<URL> prelistenURLForFileURL(const URL& url) const override;
};

/// Audio that says, by our record or by another maker's chunk, that it is a loop.
class TGRTTavioLoopTypeValidator
    : public TypeValidatorFor<TGRTAudioFileTypeValidator, TGRTTavioLoopMetaDataReader,
                              TGRTTavioLoopTaggingWriter, TGRTTavioLoopContentInfoWriter,
                              TGRTTavioLoopMetaDataWriter> {
  public:
    bool isValidContentTypeAtFileURL(const URL& url) const override;
};

}  // namespace qvct
