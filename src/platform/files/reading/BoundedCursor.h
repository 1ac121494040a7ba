#pragma once

#include "platform/base/bytes/ByteOrder.h"
#include "platform/files/reading/RandomAccessReader.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <span>
#include <string>
#include <vector>

namespace qvct {

/// A reader seen through small buffers, so that headers that lie together cost one system call.
class ReadWindow {
  public:
    static constexpr std::size_t kSize = 4096;

    explicit ReadWindow(const RandomAccessReader& reader) : reader_(reader), size_(reader.size()) {}

    std::uint64_t size() const { return size_; }
    /// `count` (at most kSize) bytes at `offset`, valid until the next call; null when they cannot be read.
    const std::uint8_t* at(std::uint64_t offset, std::size_t count);
    /// Reads directly, bypassing the buffer, when `into` is larger than it.
    bool copy(std::uint64_t offset, std::span<std::uint8_t> into);

  private:
    struct Buffer {
        std::uint64_t start = 0;
        std::size_t filled = 0;
        std::array<std::uint8_t, kSize> bytes;

        const std::uint8_t* find(std::uint64_t offset, std::size_t count) const;
    };

    const RandomAccessReader& reader_;
    std::uint64_t size_;
    Buffer head_;   // the first bytes, to which parsers come back
    Buffer other_;  // the place that was read last
};

/// All reading of containers goes through this: it parses and advances, or fails, and never looks past its
/// end.
///
/// A read that does not fit fails the cursor for good: it and all later ones give 0 or nothing, and `failed`
/// says so. So a parser can read a whole header and check once.
class BoundedCursor {
  public:
    /// Over `size` bytes at `offset`, less where the file ends before.
    BoundedCursor(ReadWindow& window, ByteOrder order, std::uint64_t offset, std::uint64_t size)
        : window_(&window),
          order_(order),
          position_(std::min(offset, window.size())),
          end_(position_ + std::min(size, window.size() - position_)) {}

    bool failed() const { return failed_; }
    std::uint64_t position() const { return position_; }
    std::uint64_t remaining() const { return failed_ ? 0 : end_ - position_; }

    std::uint8_t u8() { return static_cast<std::uint8_t>(number(1, ByteOrder::big)); }
    std::uint16_t u16() { return static_cast<std::uint16_t>(number(2, order_)); }
    std::uint32_t u32() { return static_cast<std::uint32_t>(number(4, order_)); }
    std::uint64_t u64() { return number(8, order_); }
    std::int16_t i16() { return static_cast<std::int16_t>(u16()); }
    std::int64_t i64() { return static_cast<std::int64_t>(u64()); }
    float f32() { return std::bit_cast<float>(u32()); }
    double f64() { return std::bit_cast<double>(u64()); }
    /// Four characters, the first in the highest byte, whatever the byte order.
    std::uint32_t fourCC() { return static_cast<std::uint32_t>(number(4, ByteOrder::big)); }

    void skip(std::uint64_t count);
    std::vector<std::uint8_t> bytes(std::uint64_t count);
    std::string text(std::uint64_t count);
    /// A cursor over the next `count` bytes, which this one passes.
    BoundedCursor part(std::uint64_t count);

  private:
    std::uint64_t number(std::size_t width, ByteOrder order);
    bool take(std::uint64_t count);

    ReadWindow* window_;
    ByteOrder order_;
    std::uint64_t position_;
    std::uint64_t end_;
    bool failed_ = false;
};

}  // namespace qvct
