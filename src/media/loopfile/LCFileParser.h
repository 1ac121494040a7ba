#pragma once

#include "media/loopfile/LCFileData.h"
#include "platform/base/Error.h"
#include "platform/text/Url.h"

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

class RandomAccessReader;

/// Which files a parser admits; a bit mask. Each file is of one or both of the first two kinds, or of the
/// third.
enum LCFileTypes : unsigned {
    kLCLoopRecord = 1,   ///< Files whose record, written by us, says that they are loops.
    kLCForeignLoop = 2,  ///< Files that a chunk of another maker calls a loop.
    kLCPlainAudio = 4,   ///< All other audio files.
    kLCLoopFiles = 3,
    kLCAllAudio = 7
};

/// One chunk of a container, for showing what is in a file.
struct LCChunk {
    std::string id;            ///< As in the file; bytes that are not printable are escaped.
    std::uint64_t offset = 0;  ///< Of the chunk's header in the file.
    std::uint64_t size = 0;    ///< Of the contents, as far as the file reaches.
    std::string meaning;       ///< What the chunk is and, in short, what it says.
    std::string fault;         ///< What is wrong with it; empty when nothing is.
    std::vector<LCChunk> children;
};

/// Reads what loops and plain audio files say about themselves: WAV (RIFF, RIFX, RF64, BW64), AIFF, AIFC, CAF
/// and ".loopdata", which is our record alone. The container is recognised by its first bytes, whatever the
/// name.
///
/// Only headers and descriptive chunks are read: a file of any size costs a few kilobytes and system calls.
/// What a file claims is bounded by its size before anything is allocated. A parser for a URL opens the file
/// for each operation and closes it again; a parser may be used by several threads.
class LCFileParser {
  public:
    static std::shared_ptr<LCFileParser> fileParserForURL(const URL& url);
    /// Never null: only `fileData` finds out whether the file is of an admitted kind. With
    /// `allowKeywordExtractionFromPath`, enhanced data of a file without descriptors takes the words of its
    /// name.
    static std::shared_ptr<LCFileParser> fileParserForURL(const URL& url, bool allowKeywordExtractionFromPath,
                                                          unsigned allowedFileTypes);
    /// Parses bytes or a reader instead of a file. `name` stands in for the path in messages; a ".loopdata"
    /// file is recognised by its extension.
    static std::shared_ptr<LCFileParser> fileParserForBytes(std::span<const std::uint8_t> bytes,
                                                            std::string_view name,
                                                            unsigned allowedFileTypes = kLCAllAudio);
    static std::shared_ptr<LCFileParser> fileParserForReader(std::shared_ptr<const RandomAccessReader> reader,
                                                             std::string_view name,
                                                             unsigned allowedFileTypes = kLCAllAudio);

    /// What the file says. Null, and an error with path and byte offset, when it is of no admitted kind,
    /// cannot be read or is no sound audio file.
    std::shared_ptr<LCFileData> fileData(Error* error = nullptr) const;
    /// The same with what can be derived: the length from the header, the tempo from beats and length, the
    /// beats from tempo and length where that gives a whole number. Derived values never enter the record.
    std::shared_ptr<LCFileData> enhancedFileData(Error* error = nullptr) const;
    /// Every chunk in the order of the file, even of a damaged file as far as it can be followed; faults are
    /// noted in the chunks. Empty, and an error, when the file is unreadable or no known container.
    std::vector<LCChunk> chunks(Error* error = nullptr) const;

  private:
    LCFileParser() = default;
    std::shared_ptr<const RandomAccessReader> open(Error* error) const;

    std::shared_ptr<const RandomAccessReader> reader_;  // null: the file at name_ is opened
    std::string name_;
    bool extractsKeywords_ = false;
    unsigned allowedFileTypes_ = kLCAllAudio;
};

}  // namespace qvct
