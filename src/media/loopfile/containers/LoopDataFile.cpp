#include "media/loopfile/containers/LoopDataFile.h"

#include "platform/text/Url.h"

namespace qvct {

LoopDataFile::LoopDataFile(ReadWindow& window) : Container(window, ByteOrder::big) {
    Chunk chunk;
    chunk.id = fourCC("plst");
    chunk.role = Chunk::Role::record;
    chunk.size = chunk.end = window.size();
    chunks_.push_back(chunk);
}

bool LoopDataFile::isName(std::string_view name) {
    return URL::fileURLWithPath(name).lowercasePathExtension() == "loopdata";
}

bool LoopDataFile::readFacts(LCAudioFacts& facts, Error* /*error*/) const {
    facts.isLoop = true;
    return true;
}

std::optional<std::vector<FilePiece>> LoopDataFile::piecesWith(const std::string& record,
                                                               Error* error) const {
    if (record.empty()) {
        fail(error, kErrorInvalidArgument, "a loop data file cannot be without a record");
        return std::nullopt;
    }
    PieceList pieces;
    pieces.addBytes(record);
    return pieces.take();
}

}  // namespace qvct
