#pragma once

#include "platform/text/Url.h"
#include "taxonomy/TaggingTypes.h"

namespace qvct {

/// What a file is by its name alone.
class QVContentTaggingTypes {
  public:
    /// The file type of a URL by its extension, whatever its case; kFileTypeNone for an extension that no
    /// content has. Whether an audio file is a loop only its contents tell: by its name it is an audio file.
    static FileType fallBackFileTypeForURL(const URL& url);
    /// A word for the type, for people and queries: "patch", "loop", "preset", ...; "other" for none.
    static std::string_view nameForFileType(std::int64_t type);
};

}  // namespace qvct
