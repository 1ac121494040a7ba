#include "formats/bundle/TGRTBundleTypeValidators.h"

#include "platform/files/FileAccess.h"

namespace qvct {

bool TGRTPatchTypeValidator::isValidContentTypeAtFileURL(const URL& url) const {
    return url.isFileURL() && TGRTPatchMetaDataReader::supportsFileExtension(url.pathExtension()) &&
           isDirectory(url.path());
}

unsigned TGRTPatchTypeValidator::itemActionsForFileURL(const URL& url) const {
    if (!isValidContentTypeAtFileURL(url)) return 0;
    return prelistenURLForFileURL(url) ? kItemLoadableOnTrack | kItemCanPrelisten : kItemLoadableOnTrack;
}

std::optional<URL> TGRTPatchTypeValidator::prelistenURLForFileURL(const URL& url) const {
    const URL preview = url.URLByAppendingPathComponent("prelisten.caf");
    return preview.isFileURL() && fileExists(preview.path()) ? std::optional(preview) : std::nullopt;
}

bool TGRTOstraProjectTypeValidator::isValidContentTypeAtFileURL(const URL& url) const {
    return url.isFileURL() && TGRTOstraProjectMetaDataReader::supportsFileExtension(url.pathExtension()) &&
           isDirectory(url.path());
}

}  // namespace qvct
