#include "autotagging/xml/XPathDeadline.h"

#include <algorithm>

namespace qvct {
namespace {

/// The time that kMostXPathSteps take at most.
constexpr std::chrono::duration<double> kTimeOfAllSteps{1};

XPathDeadline::Clock::time_point& endOfThread() {
    thread_local XPathDeadline::Clock::time_point end = XPathDeadline::Clock::time_point::max();
    return end;
}

}  // namespace

XPathDeadline::XPathDeadline(Clock::time_point end) : former_(endOfThread()) {
    endOfThread() = std::min(former_, end);
}

XPathDeadline::~XPathDeadline() {
    endOfThread() = former_;
}

double XPathDeadline::shareOfSteps() {
    const Clock::time_point end = endOfThread();
    if (end == Clock::time_point::max()) return 1;
    return std::clamp((end - Clock::now()) / kTimeOfAllSteps, 0.0, 1.0);
}

}  // namespace qvct
