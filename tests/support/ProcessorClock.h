#pragma once

#include <chrono>
#include <ctime>

namespace qvct::test {

/// The processor time of this process, which bounds what is computed on a busy machine, too.
struct ProcessorClock {
    using duration = std::chrono::duration<double>;
    using rep = duration::rep;
    using period = duration::period;
    using time_point = std::chrono::time_point<ProcessorClock>;
    static constexpr bool is_steady = true;

    static time_point now() {
        return time_point(duration(static_cast<double>(std::clock()) / CLOCKS_PER_SEC));
    }
};

}  // namespace qvct::test
