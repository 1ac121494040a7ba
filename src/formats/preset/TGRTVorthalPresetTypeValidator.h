#pragma once

#include "formats/BaseTypeValidator.h"
#include "formats/preset/TGRTVorthalPresetMetaDataReader.h"
#include "formats/preset/TGRTVorthalPresetMetaDataWriter.h"

#include <optional>

namespace qvct {

/// A file called "*.vcp". One writer serves all three roles.
class TGRTVorthalPresetTypeValidator
    : public TypeValidatorFor<BaseTypeValidator, TGRTVorthalPresetMetaDataReader,
                              TGRTVorthalPresetMetaDataWriter, TGRTVorthalPresetMetaDataWriter,
                              TGRTVorthalPresetMetaDataWriter> {
  public:
    bool isValidContentTypeAtFileURL(const URL& url) const override;
    /// Loadable in a plug-in, whatever the URL.
    unsigned itemActionsForFileURL(const URL& /*url*/) const override { return kItemLoadableInPlugIn; }
    std::optional<URL> prelistenURLForFileURL(const URL& /*url*/) const override { return std::nullopt; }
};

}  // namespace qvct
