#pragma once

#include "formats/BaseTypeValidator.h"
#include "formats/settings/TGRTCstSxvPstMetaDataReader.h"
#include "formats/settings/TGRTCstSxvPstWriters.h"

#include <optional>

namespace qvct {

/// A file called "*.cst", "*.sxv", "*.pst" or "*.aaz" that is not part of a patch.
class TGRTCstSxvPstTypeValidator
    : public TypeValidatorFor<BaseTypeValidator, TGRTCstSxvPstMetaDataReader, TGRTCstSxvPstTaggingWriter,
                              TGRTCstSxvPstContentInfoWriter, TGRTCstSxvPstMetaDataWriter> {
  public:
    bool isValidContentTypeAtFileURL(const URL& url) const override;
    /// What the four predicates below say of a valid URL.
    unsigned itemActionsForFileURL(const URL& url) const override;
    std::optional<URL> prelistenURLForFileURL(const URL& /*url*/) const override { return std::nullopt; }

    bool isLoadableOnTrack(const URL& url) const;
    bool isLoadableInPlugin(const URL& url) const;
    bool canPrelisten(const URL& /*url*/) const { return false; }
    bool canInsertOnTrack(const URL& /*url*/) const { return false; }
    /// Whether it lies directly in a patch bundle.
    bool isParentFolderPatch(const URL& url) const;
};

}  // namespace qvct
