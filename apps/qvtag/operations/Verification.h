#pragma once

#include "media/loopfile/LCFingerprint.h"
#include "metadata/TGRTMetaData.h"
#include "output/Output.h"
#include "platform/base/Error.h"
#include "platform/text/Url.h"

#include <optional>
#include <string>
#include <vector>

namespace qvct::tool {

/// What a write must leave alone, taken before it and compared after it: the samples of audio and every chunk
/// that is not ours, the whole of a settings file, every line of a preset that is not ours. For every kind,
/// the record is read back, too.
class Verification {
  public:
    /// Nothing and an error when the item cannot be read.
    static std::optional<Verification> before(const URL& url, Error* error);

    /// One sentence for each fault; empty when all is as it should be.
    std::vector<std::string> faultsAfterWriting(const TGRTMetaData& expected) const;
    /// What was compared: {"audioBytes","audioHash","chunks"}, {"bytes"} or nothing.
    Json summary() const;
    /// The same in words.
    std::string description() const;

  private:
    explicit Verification(URL url) : url_(std::move(url)) {}

    URL url_;
    std::optional<LCFingerprint> audio_;
    std::optional<std::string> untouched_;
};

}  // namespace qvct::tool
