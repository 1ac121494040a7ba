#pragma once

#include <bit>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace qvct::demo {

/// Lays out numbers and text one after another, in one byte order.
class ByteWriter {
  public:
    explicit ByteWriter(std::endian order) : order_(order) {}

    template <std::integral Integer>
    ByteWriter& number(Integer value) {
        return bytes(static_cast<std::uint64_t>(value), sizeof(Integer));
    }
    ByteWriter& number(float value) { return number(std::bit_cast<std::uint32_t>(value)); }
    ByteWriter& number(double value) { return number(std::bit_cast<std::uint64_t>(value)); }

    /// The `count` (at most 8) low bytes of `value`.
    ByteWriter& bytes(std::uint64_t value, int count) {
        for (int i = 0; i < count; ++i) {
            const int position = order_ == std::endian::little ? i : count - 1 - i;
            data_.push_back(static_cast<char>(value >> (8 * position) & 0xFF));
        }
        return *this;
    }

    ByteWriter& zeros(std::size_t count) {
        data_.append(count, '\0');
        return *this;
    }

    ByteWriter& text(std::string_view text) {
        data_.append(text);
        return *this;
    }

    ByteWriter& zeroTerminated(std::string_view string) { return text(string).zeros(1); }

    const std::string& data() const { return data_; }

  private:
    std::endian order_;
    std::string data_;
};

}  // namespace qvct::demo
