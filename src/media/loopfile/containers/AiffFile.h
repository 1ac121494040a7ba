#pragma once

#include "media/loopfile/containers/IffFile.h"

namespace qvct {

/// FORM of type AIFF or AIFC. Our record is an application chunk with our signature.
class AiffFile : public IffFile {
  public:
    static constexpr std::uint32_t kSignature = fourCC("qvct");

    AiffFile(ReadWindow& window, std::uint32_t form);

    std::string_view formatName() const override { return form_ == fourCC("AIFC") ? "AIFC" : "AIFF"; }
    bool readFacts(LCAudioFacts& facts, Error* error) const override;

  protected:
    bool isAudio(std::uint32_t id) const override { return id == fourCC("SSND"); }
    std::optional<std::uint64_t> signatureOf(const Chunk& chunk) const override;
    std::string recordStart() const override { return "APPLqvct"; }
    bool canGrowTo(std::uint64_t formSize) const override { return formSize < 0xFFFFFFFF; }
    std::string formHeader(std::uint64_t formSize) const override;

  private:
    std::uint32_t form_;
};

}  // namespace qvct
