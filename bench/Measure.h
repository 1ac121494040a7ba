#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <string_view>
#include <utility>
#include <vector>

#include <fmt/format.h>
#include <sys/resource.h>

namespace qvct::bench {

/// Seconds on the clock: other threads and processes, disk and all.
inline double clockTime() {
    return std::chrono::duration<double>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

/// Seconds of processor time, of all threads and of the processes that were waited for: what does not depend
/// on who else is busy.
inline double processorTime() {
    double sum = 0;
    for (const int who : {RUSAGE_SELF, RUSAGE_CHILDREN}) {
        rusage usage{};
        ::getrusage(who, &usage);
        for (const timeval& time : {usage.ru_utime, usage.ru_stime})
            sum += static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) * 1e-6;
    }
    return sum;
}

/// Seconds that a work takes.
template <typename Work>
double secondsOf(Work work, double (*now)() = clockTime) {
    const double start = now();
    work();
    return now() - start;
}

inline double medianOf(std::vector<double> values) {
    const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

/// Seconds that one call takes on what `prepare`, which does not count, makes for it: the median of several,
/// since these machines are noisy and shared.
template <typename Prepare, typename Work>
double medianSecondsOn(Prepare prepare, Work work, std::size_t repetitions, double (*now)() = processorTime) {
    std::vector<double> seconds;
    for (std::size_t i = 0; i < repetitions; ++i) {
        const auto prepared = prepare();
        seconds.push_back(secondsOf([&] { work(prepared); }, now));
    }
    return medianOf(std::move(seconds));
}

/// The same for work that needs nothing.
template <typename Work>
double medianSeconds(Work work, std::size_t repetitions = 7, double (*now)() = processorTime) {
    return medianSecondsOn([] { return 0; }, [&work](int /*nothing*/) { work(); }, repetitions, now);
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
