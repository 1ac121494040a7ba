#pragma once

#include "media/loopfile/LCFileData.h"
#include "platform/base/Error.h"
#include "platform/files/FileStamp.h"
#include "platform/text/Url.h"

#include <memory>
#include <optional>
#include <string>

namespace qvct {

/// How a record is written into a file.
struct LCWriteOptions {
    bool keepsTimes = false;  ///< The file keeps its times of access and change.
    /// The new file is read back and compared with the old one before it takes its place: the audio, and
    /// every chunk that is not ours. Costs a read of both.
    bool verifies = false;
    /// All checks of a write are made, but nothing is written; the result says whether it would be.
    bool isDryRun = false;
    /// The state of the file that the data were read from; if it has changed since, that is an error.
    std::optional<FileStamp> expected = std::nullopt;
};

/// Writes the record of file data into the file at a URL, and nothing else.
///
/// Audio and every chunk that is not ours come out byte for byte, in their order, pad bytes included. The new
/// file is made beside the old one, flushed and renamed over it: mode, owner (where permitted) and extended
/// attributes stay, a symbolic link is followed, another hard link keeps the old contents. On any failure the
/// old file stands untouched and the new one is removed. A file that cannot be rewritten with certainty
/// (sizes that contradict each other, an unreadable record, one that would outgrow its container) is refused.
///
/// @cost  At most one copy of the file; its headers alone where the file system shares extents.
class LCFileWriter {
  public:
    static std::shared_ptr<LCFileWriter> fileWriterForURL(const URL& url, LCWriteOptions options = {});

    /// Whether the record now stands in the file. Null data fails. An empty record removes our chunk. A file
    /// called ".loopdata" need not exist.
    bool writeFileData(const std::shared_ptr<const LCFileData>& data, Error* error = nullptr) const;

  private:
    LCFileWriter(std::string path, LCWriteOptions options);

    std::string path_;
    LCWriteOptions options_;
};

}  // namespace qvct
