#pragma once

#include "media/loopfile/containers/IffFile.h"

namespace qvct {

/// RIFF and RIFX of form WAVE, and their 64-bit successors RF64 and BW64, whose chunk `ds64` holds the sizes
/// that do not fit into 32 bits.
class WavFile : public IffFile {
  public:
    static constexpr std::uint32_t kRecordId = fourCC("qvct");

    WavFile(ReadWindow& window, std::uint32_t magic);
    static bool isMagic(std::uint32_t magic);

    std::string_view formatName() const override;
    bool readFacts(LCAudioFacts& facts, Error* error) const override;
    std::uint64_t rewrittenPrefix(const Chunk& chunk) const override;

  protected:
    std::uint64_t sizeOf(std::uint32_t id, std::uint32_t size) const override;
    bool isAudio(std::uint32_t id) const override { return id == fourCC("data"); }
    std::optional<std::uint64_t> signatureOf(const Chunk& chunk) const override;
    std::string recordStart() const override;
    bool canGrowTo(std::uint64_t formSize) const override;
    std::string formHeader(std::uint64_t formSize) const override;
    void addChunk(PieceList& pieces, const Chunk& chunk, std::uint64_t formSize) const override;

  private:
    /// Sizes that `ds64` gives; 0 where it is absent.
    struct LongSizes {
        std::uint64_t form = 0;
        std::uint64_t data = 0;
        std::uint64_t frames = 0;
        std::vector<std::pair<std::uint32_t, std::uint64_t>> others;
    };

    /// What the header says of audio that is neither PCM nor float.
    struct Coding {
        std::uint16_t number = 0;
        std::uint32_t bytesPerSecond = 0;
        std::uint16_t bytesPerBlock = 0;
    };

    bool isLong() const { return magic_ == fourCC("RF64") || magic_ == fourCC("BW64"); }
    void readLongSizes();
    bool readFormat(const Chunk& format, const Chunk& data, LCAudioFacts& facts, Error* error) const;
    std::uint64_t codedFrames(const Coding& coding, std::uint64_t bytes, const LCAudioFacts& facts) const;
    std::uint64_t factFrames() const;
    std::uint64_t saidFrames(std::uint64_t held, std::uint64_t framesOfBlock) const;
    std::uint64_t likelyFrames(const Coding& coding, std::uint64_t bytes, double sampleRate) const;

    std::uint32_t magic_;
    std::uint32_t shortFormSize_ = 0;
    LongSizes longSizes_;
};

}  // namespace qvct
