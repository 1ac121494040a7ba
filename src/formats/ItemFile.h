#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/text/Url.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <utility>
#include <vector>

namespace qvct {

struct HeardSound;
class LCFileData;
class Listener;
class RandomAccessReader;

/// The file at an item's URL: opened once, on first use, and parsed once.
///
/// It stays open as long as this object lives. A file that cannot be opened or parsed is not tried again; the
/// same error is given each time. Folders and missing files count as unreadable. Not thread-safe.
class QVCT_API ItemFile {
  public:
    /// Does not look at the disk yet.
    explicit ItemFile(URL url);
    ~ItemFile();

    const URL& url() const { return url_; }

    /// Null, and an error with the path, for anything but a regular file that can be read.
    std::shared_ptr<const RandomAccessReader> reader(Error* error = nullptr);
    /// What an audio file says, with what can be derived from it (`LCFileParser::enhancedFileData`). Null,
    /// and an error, for what is not audio.
    std::shared_ptr<LCFileData> audio(Error* error = nullptr);
    /// What can be heard in it, listened to once, with that listener. Null, and an error, for what cannot be
    /// decoded.
    std::shared_ptr<const HeardSound> sound(Listener& listener, Error* error = nullptr);
    /// What was heard in it; null if nobody listened.
    std::shared_ptr<const HeardSound> heardSound() const { return sound_ ? sound_->value : nullptr; }
    /// All bytes. They are not kept.
    std::optional<std::vector<std::uint8_t>> bytes(std::uint64_t limit, Error* error = nullptr);

  private:
    /// Something that was looked for, and what came of it.
    template <typename Value>
    struct Attempt {
        std::shared_ptr<Value> value;
        Error error;

        std::shared_ptr<Value> answer(Error* reason) const {
            if (!value && reason != nullptr) *reason = error;
            return value;
        }
    };

    URL url_;
    std::optional<Attempt<const RandomAccessReader>> reader_;
    std::optional<Attempt<LCFileData>> audio_;
    std::optional<Attempt<const HeardSound>> sound_;
};

}  // namespace qvct
