#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <string_view>
#include <vector>

#include <fmt/format.h>

namespace qvct::bench {

/// Seconds that one call takes: the median of several, since these machines are noisy.
template <typename Work>
double medianSeconds(Work work, std::size_t repetitions = 7) {
    using Clock = std::chrono::steady_clock;
    std::vector<double> seconds;
    for (std::size_t i = 0; i < repetitions; ++i) {
        const auto start = Clock::now();
        work();
        seconds.push_back(std::chrono::duration<double>(Clock::now() - start).count());
    }
    std::nth_element(seconds.begin(), seconds.begin() + static_cast<std::ptrdiff_t>(repetitions / 2),
                     seconds.end());
    return seconds[repetitions / 2];
}

/// Keeps the compiler from dropping work whose result nobody reads.
template <typename T>
void keep(const T& value) {
    asm volatile("" : : "g"(&value) : "memory");
}

inline void printRow(std::string_view what, std::string_view measured, std::string_view target) {
    fmt::print("{:<58} {:>24}   {}\n", what, measured, target);
}

}  // namespace qvct::bench
