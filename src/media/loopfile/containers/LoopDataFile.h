#pragma once

#include "media/loopfile/containers/Container.h"

namespace qvct {

/// A ".loopdata" file: our record alone, a loop without audio of its own. An empty file has no record yet.
class LoopDataFile : public Container {
  public:
    explicit LoopDataFile(ReadWindow& window);
    /// Whether the extension, in any case, is that of such files.
    static bool isName(std::string_view name);

    std::string_view formatName() const override { return "loop data"; }
    bool isRecordAlone() const override { return true; }
    bool readFacts(LCAudioFacts& facts, Error* error) const override;

  protected:
    std::optional<std::vector<FilePiece>> piecesWith(const std::string& record, Error* error) const override;
};

}  // namespace qvct
