#pragma once

#include "media/loopfile/containers/Container.h"

namespace qvct {

/// What WAV and AIFF share: one form of 12 bytes, and in it chunks of an 8-byte header, contents and a pad
/// byte after an odd size.
///
/// Our chunk always goes to the end of the form, so that the audio stays where it is; bytes that follow the
/// chunks then follow ours. Pad bytes that are missing are added.
class IffFile : public Container {
  public:
  protected:
    using Container::Container;

    /// Lists the chunks of a form whose header says that `formSize` bytes follow its first 8; `isOpenEnded`
    /// when its size is unknown (the recorder could not go back to fill it in).
    void walk(std::uint64_t formSize, bool isOpenEnded);
    /// Notes a fault when several chunks of this id, which describe the audio, differ: there is no knowing
    /// which one players follow.
    void refuseContradictions(std::uint32_t id);
    std::optional<std::vector<FilePiece>> piecesWith(const std::string& record, Error* error) const override;

    /// The size of a chunk whose header says `size`.
    virtual std::uint64_t sizeOf(std::uint32_t /*id*/, std::uint32_t size) const { return size; }
    virtual bool isAudio(std::uint32_t id) const = 0;
    /// How many bytes our signature takes at the start of the contents when the chunk is a record; nothing
    /// when it is not.
    virtual std::optional<std::uint64_t> signatureOf(const Chunk& chunk) const = 0;
    /// Our chunk's id, and the signature before the record.
    virtual std::string recordStart() const = 0;
    virtual bool canGrowTo(std::uint64_t formSize) const = 0;
    /// The first 12 bytes of a form of that size.
    virtual std::string formHeader(std::uint64_t formSize) const = 0;
    virtual void addChunk(PieceList& pieces, const Chunk& chunk, std::uint64_t formSize) const;

    std::string number(std::uint64_t value, std::size_t width) const;

  private:
    Chunk chunkAt(std::uint64_t offset) const;
    bool leadsOn(const Chunk& chunk) const;
    bool startsOneByteEarlier(const Chunk& chunk) const;
    void takeOverPad();
    std::string recordChunk(const std::string& record) const;

    std::uint64_t formEnd_ = 0;  ///< At most the file's.
};

}  // namespace qvct
