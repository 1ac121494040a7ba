#include "formats/settings/TGRTCstSxvPstTypeValidator.h"

#include "formats/bundle/TGRTBundleTypeValidators.h"
#include "platform/files/FileAccess.h"

namespace qvct {

bool TGRTCstSxvPstTypeValidator::isValidContentTypeAtFileURL(const URL& url) const {
    return url.isFileURL() && TGRTCstSxvPstMetaDataReader::supportsFileExtension(url.pathExtension()) &&
           fileExists(url.path()) && !isDirectory(url.path()) && !isParentFolderPatch(url);
}

unsigned TGRTCstSxvPstTypeValidator::itemActionsForFileURL(const URL& url) const {
    if (!isValidContentTypeAtFileURL(url)) return 0;
    return (isLoadableOnTrack(url) ? kItemLoadableOnTrack : 0U) |
           (isLoadableInPlugin(url) ? kItemLoadableInPlugIn : 0U) |
           (canPrelisten(url) ? kItemCanPrelisten : 0U) |
           (canInsertOnTrack(url) ? kItemInsertableOnTrack : 0U);
}

bool TGRTCstSxvPstTypeValidator::isLoadableOnTrack(const URL& url) const {
    return url.lowercasePathExtension() == "cst" || isLoadableInPlugin(url);
}

bool TGRTCstSxvPstTypeValidator::isLoadableInPlugin(const URL& url) const {
    const std::string extension = url.lowercasePathExtension();
    return extension == "sxv" || extension == "pst";
}

bool TGRTCstSxvPstTypeValidator::isParentFolderPatch(const URL& url) const {
    static const TGRTPatchTypeValidator patches;
    return patches.isValidContentTypeAtFileURL(url.URLByDeletingLastPathComponent());
}

}  // namespace qvct
