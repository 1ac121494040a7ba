#pragma once

#include "media/loopfile/containers/Container.h"

#include <array>

namespace qvct {

/// CAF: a header of 8 bytes, then chunks of a 12-byte header with a 64-bit size and their contents, without
/// padding. The last chunk may be audio of size -1, which reaches to the end of the file.
///
/// Our record is a `uuid` chunk with our identifier. It goes to the end of the file, or before audio of size
/// -1, behind which no chunk can lie.
class CafFile : public Container {
  public:
    /// 5ce54f6c-9a0b-4d5f-8d3e-716376742e31
    static constexpr std::array<std::uint8_t, 16> kRecordUuid = {
        0x5C, 0xE5, 0x4F, 0x6C, 0x9A, 0x0B, 0x4D, 0x5F, 0x8D, 0x3E, 0x71, 0x63, 0x76, 0x74, 0x2E, 0x31};

    explicit CafFile(ReadWindow& window);

    std::string_view formatName() const override { return "CAF"; }
    bool readFacts(LCAudioFacts& facts, Error* error) const override;

  protected:
    std::optional<std::vector<FilePiece>> piecesWith(const std::string& record, Error* error) const override;

  private:
    void walk();
    bool isRecord(const Chunk& chunk) const;
    bool readFormat(const Chunk& description, LCAudioFacts& facts, Error* error) const;
    std::uint64_t packetTableFrames(std::uint64_t bytes, std::uint32_t framesPerPacket) const;

    bool endsOpen_ = false;  // with audio of size -1
    std::uint64_t chunksEnd_ = 0;
};

}  // namespace qvct
