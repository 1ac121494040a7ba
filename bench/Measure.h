#pragma once

#include <algorithm>
#include <cstddef>
#include <ctime>
#include <string_view>
#include <vector>

#include <fmt/format.h>

namespace qvct::bench {

/// Seconds of processor time that one call takes on what `prepare`, which does not count, makes for it: the
/// median of several, since these machines are noisy and shared.
template <typename Prepare, typename Work>
double medianSecondsOn(Prepare prepare, Work work, std::size_t repetitions) {
    const auto now = [] { return static_cast<double>(std::clock()) / CLOCKS_PER_SEC; };
    std::vector<double> seconds;
    for (std::size_t i = 0; i < repetitions; ++i) {
        const auto prepared = prepare();
        const double start = now();
        work(prepared);
        seconds.push_back(now() - start);
    }
    std::nth_element(seconds.begin(), seconds.begin() + static_cast<std::ptrdiff_t>(repetitions / 2),
                     seconds.end());
    return seconds[repetitions / 2];
}

/// The same for work that needs nothing.
template <typename Work>
double medianSeconds(Work work, std::size_t repetitions = 7) {
    return medianSecondsOn([] { return 0; }, [&work](int /*nothing*/) { work(); }, repetitions);
}

/// Keeps the compiler from dropping work whose result nobody reads.
template <typename T>
void keep(const T& value) {
    asm volatile("" : : "g"(&value) : "memory");
}

/// One row of the table that `bench/run` gathers: what, how much, and what it should be (or nothing). Two
/// blanks in front say that a row belongs to the one above it.
inline void printRow(std::string_view what, std::string_view measured, std::string_view target) {
    fmt::print("{:<62} | {:>28} | {}\n", what, measured, target);
}

}  // namespace qvct::bench
