#pragma once

#include "media/loopfile/LCFileData.h"
#include "platform/base/Error.h"
#include "platform/files/reading/BoundedCursor.h"
#include "platform/files/replacement/FileReplacement.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Four characters as a number, the first in the highest byte.
constexpr std::uint32_t fourCC(const char (&code)[5]) {
    std::uint32_t value = 0;
    for (int i = 0; i < 4; ++i) value = value << 8U | static_cast<unsigned char>(code[i]);
    return value;
}
/// Whether all four characters are printable ASCII.
bool isPrintableCode(std::uint32_t code);
/// The characters, escaped where they are not printable.
std::string textOfCode(std::uint32_t code);

/// A chunk as it lies in the file.
struct Chunk {
    enum class Role : std::uint8_t { other, audio, record };

    std::uint32_t id = 0;
    Role role = Role::other;
    std::uint64_t offset = 0;     ///< Of its header.
    std::uint64_t contents = 0;   ///< Offset of its contents; in a record, behind our signature.
    std::uint64_t size = 0;       ///< Of the contents, as far as the file reaches.
    std::uint64_t signature = 0;  ///< Bytes of our signature before the contents of a record.
    std::uint64_t end = 0;        ///< Offset behind it and its pad byte.
    const char* fault =
        nullptr;  ///< Why a file with this chunk is not rewritten; null when nothing is wrong.

    /// Makes it our record's chunk: its contents begin behind a signature of so many bytes.
    void becomeRecord(std::uint64_t signatureSize) {
        role = Role::record;
        signature = signatureSize;
        contents += signatureSize;
        size -= signatureSize;
    }
};

/// The pieces of a file to be made, with neighbouring ranges of the old one joined.
class PieceList {
  public:
    void addBytes(std::string bytes);
    void addRange(std::uint64_t begin, std::uint64_t end);
    std::vector<FilePiece> take() { return std::move(pieces_); }

  private:
    std::vector<FilePiece> pieces_;
};

/// A file format that consists of chunks. One class per format knows how to list, find and replace them.
///
/// Errors name the chunk and its byte offset; the caller adds the path.
class Container {
  public:
    /// Chunks beyond this number are not looked at, and such a file is not rewritten.
    static constexpr std::size_t kMostChunks = 65536;
    /// Largest record that is read or written.
    static constexpr std::uint64_t kLargestRecord = 64ULL << 20U;

    /// The container that the first bytes announce; a ".loopdata" file, which has no such mark, is recognised
    /// by the extension of `name`. Null and an error for anything else. The window must outlive the
    /// container.
    static std::unique_ptr<Container> open(ReadWindow& window, std::string_view name, Error* error);

    virtual ~Container() = default;
    Container(const Container&) = delete;
    Container& operator=(const Container&) = delete;

    const std::vector<Chunk>& chunks() const { return chunks_; }
    const Chunk* find(std::uint32_t id) const;
    const Chunk* find(Chunk::Role role) const;
    ReadWindow& window() const { return window_; }
    BoundedCursor cursor(const Chunk& chunk) const { return {window_, order_, chunk.contents, chunk.size}; }

    virtual std::string_view formatName() const = 0;
    /// What is wrong with the whole; not set when nothing is.
    const Error& fault() const { return fault_; }
    /// Whether it is our record and nothing else.
    virtual bool isRecordAlone() const { return false; }
    /// Format and music; an error when the file is no sound audio file.
    virtual bool readFacts(LCAudioFacts& facts, Error* error) const = 0;
    /// The bytes of the record; nothing when there is none, or none that can be read.
    std::optional<std::vector<std::uint8_t>> recordBytes() const;
    /// The file with this record in place of any that it has; an empty record only removes that. Nothing, and
    /// the reason, when this cannot be done with certainty.
    std::optional<std::vector<FilePiece>> rewritten(const std::string& record, Error* error) const;
    /// How many bytes at the start of a chunk's contents a rewrite has to change.
    virtual std::uint64_t rewrittenPrefix(const Chunk&) const { return 0; }

  protected:
    Container(ReadWindow& window, ByteOrder order) : window_(window), order_(order) {}

    /// Whether the bytes behind the last chunk only fill the file up: few, and all of them zero.
    bool areFiller(std::uint64_t begin, std::uint64_t end) const;
    virtual std::optional<std::vector<FilePiece>> piecesWith(const std::string& record,
                                                             Error* error) const = 0;

    ReadWindow& window_;
    ByteOrder order_;
    std::vector<Chunk> chunks_;
    Error fault_;
};

/// Fails at the chunk; always false.
bool failAt(Error* error, const Chunk& chunk, std::string_view reason);

/// Whether a file can have that many frames a second and channels.
bool checkFormat(const LCAudioFacts& facts, const Chunk& chunk, Error* error);

}  // namespace qvct
