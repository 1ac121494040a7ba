#pragma once

#include <cstdint>
#include <string_view>

namespace qvct {

// Bytes put into a file by its descriptor. On failure the answer is false, and `errno` says why.

/// Writes all of the bytes, from `position` on.
bool writeAll(int descriptor, std::string_view bytes, std::uint64_t position);

/// A stretch of one file, and where it goes in another.
struct FileRange {
    int from;
    std::uint64_t offset;
    std::uint64_t length;
    int to;
    std::uint64_t position;

    void advance(std::uint64_t count) {
        offset += count;
        length -= count;
        position += count;
    }
};

/// Copies a stretch; ESTALE when the file ends before it does. Holes stay holes (what stands at their place
/// in the other file is not touched), and whole blocks that keep their place within a block are shared where
/// the file system can.
bool copyRange(FileRange range);

}  // namespace qvct
