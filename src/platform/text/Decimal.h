#pragma once

#include <array>
#include <charconv>
#include <cmath>

namespace qvct {

/// The number that was meant by one that was kept in single precision: 86.6 for 86.5999984741211, the
/// shortest decimal that single precision keeps as the same. Whole numbers, and those of double precision,
/// stay.
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
