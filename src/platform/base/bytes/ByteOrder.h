#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

enum class ByteOrder { little, big };

/// The number that up to 8 bytes stand for.
constexpr std::uint64_t numberOf(std::span<const std::uint8_t> bytes, ByteOrder order) {
    std::uint64_t value = 0;
    for (std::size_t i = 0; i < bytes.size(); ++i)
        value = value << 8U | bytes[order == ByteOrder::big ? i : bytes.size() - 1 - i];
    return value;
}

inline std::uint64_t numberOf(std::string_view bytes, ByteOrder order) {
    return numberOf(std::span(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size()), order);
}

/// The lowest `width` bytes of a number.
inline std::string bytesOf(std::uint64_t value, std::size_t width, ByteOrder order) {
    std::string bytes(width, '\0');
    for (std::size_t i = 0; i < width; ++i, value >>= 8U)
        bytes[order == ByteOrder::big ? width - 1 - i : i] = static_cast<char>(value & 0xFFU);
    return bytes;
}

/// The four characters that a code of four bytes spells.
inline std::string fourCharacters(std::uint32_t code) {
    return bytesOf(code, 4, ByteOrder::big);
}

}  // namespace qvct
