#pragma once

#include "platform/base/Error.h"
#include "platform/text/Url.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

class RandomAccessReader;

/// Fingerprint of all that a write must not touch, for comparing a file before and after.
struct LCFingerprint {
    struct Part {
        std::string id;
        std::uint64_t size = 0;
        std::uint64_t hash = 0;  ///< 64-bit FNV-1a of the contents and the pad bytes.
        bool operator==(const Part&) const = default;
    };
    std::uint64_t audioSize = 0;
    std::uint64_t audioHash = 0;
    std::vector<Part> chunks;  ///< Every chunk that is not ours, in the order of the file.

    bool operator==(const LCFingerprint&) const = default;
    /// One sentence for each difference; empty when there is none.
    std::vector<std::string> differences(const LCFingerprint& after) const;
};

/// Nothing and an error for a file that is no container of ours.
/// @cost  Reads the whole file.
std::optional<LCFingerprint> fingerprintOfFile(const URL& url, Error* error = nullptr);
/// The same over a reader; `name` stands in for the path.
std::optional<LCFingerprint> fingerprintOfReader(const RandomAccessReader& reader, std::string_view name,
                                                 Error* error = nullptr);

}  // namespace qvct
