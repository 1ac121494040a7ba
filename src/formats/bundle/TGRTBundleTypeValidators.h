#pragma once

#include "formats/BaseTypeValidator.h"
#include "formats/bundle/TGRTBundleMetaDataReader.h"
#include "formats/bundle/TGRTBundleWriters.h"
#include "formats/bundle/TGRTPatchMetaDataReader.h"

#include <optional>

namespace qvct {

/// A folder called "*.patch".
class TGRTPatchTypeValidator
    : public TypeValidatorFor<BaseTypeValidator, TGRTPatchMetaDataReader, TGRTPatchTaggingWriter,
                              TGRTPatchContentInfoWriter, TGRTPatchMetaDataWriter> {
  public:
    bool isValidContentTypeAtFileURL(const URL& url) const override;
    /// Loadable on a track; can be prelistened when it holds a preview.
    unsigned itemActionsForFileURL(const URL& url) const override;
    /// The recorded preview inside it.
    std::optional<URL> prelistenURLForFileURL(const URL& url) const override;
};

/// A folder called "*.ostrax".
class TGRTOstraProjectTypeValidator
    : public TypeValidatorFor<BaseTypeValidator, TGRTOstraProjectMetaDataReader,
                              TGRTOstraProjectTaggingWriter, TGRTOstraProjectContentInfoWriter,
                              TGRTOstraProjectMetaDataWriter> {
  public:
    bool isValidContentTypeAtFileURL(const URL& url) const override;
    unsigned itemActionsForFileURL(const URL& /*url*/) const override { return 0; }
    std::optional<URL> prelistenURLForFileURL(const URL& /*url*/) const override { return std::nullopt; }
};

}  // namespace qvct
