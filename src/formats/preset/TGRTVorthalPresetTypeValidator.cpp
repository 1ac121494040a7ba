#include "formats/preset/TGRTVorthalPresetTypeValidator.h"

#include "platform/files/FileAccess.h"

namespace qvct {

bool TGRTVorthalPresetTypeValidator::isValidContentTypeAtFileURL(const URL& url) const {
    return url.isFileURL() && TGRTVorthalPresetMetaDataReader::supportsFileExtension(url.pathExtension()) &&
           fileExists(url.path()) && !isDirectory(url.path());
}

}  // namespace qvct
