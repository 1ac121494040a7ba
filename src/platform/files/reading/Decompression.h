#pragma once

#include "platform/base/Error.h"

#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace qvct {

/// Most that one piece of compressed data may grow to, in bytes.
inline constexpr std::size_t kLargestDecompressed = std::size_t{256} << 20;
/// Most bytes that may come out for each byte that goes in.
inline constexpr std::size_t kHighestCompressionRatio = 1000;

/// Decompresses gzip (one member or several), zlib or Zstandard (one frame or several), told apart by their
/// first bytes.
///
/// Nothing and an error when the bytes are of no such format, damaged, cut short, followed by something else,
/// or grow beyond either bound; what was decompressed up to there is dropped.
/// @cost  O(output); memory at most twice the output.
std::optional<std::vector<std::uint8_t>> decompress(std::span<const std::uint8_t> bytes,
                                                    Error* error = nullptr);

}  // namespace qvct
