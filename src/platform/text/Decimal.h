#pragma once

#include <array>
#include <charconv>
#include <cmath>

namespace qvct {

/// The decimal that was meant by a number that was stored in single precision: 86.6 for 86.5999984741211,
/// being the shortest decimal with the same value in single precision. Whole numbers, and those that need
/// double precision, stay as they are.
inline double decimalOf(double number) {
    const auto single = static_cast<float>(number);
    if (double{single} != number || std::trunc(number) == number) return number;
    constexpr std::size_t longest = 32;
    std::array<char, longest> text{};
    const char* end = std::to_chars(text.data(), text.data() + text.size(), single).ptr;
    std::from_chars(text.data(), end, number);
    return number;
}

}  // namespace qvct
