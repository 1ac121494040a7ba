#pragma once

#include <chrono>

namespace qvct {

/// While one lives, the expressions that its thread evaluates take no more steps than fit into the time that
/// is left. Deadlines may be nested: the earliest counts.
class XPathDeadline {
  public:
    using Clock = std::chrono::steady_clock;

    explicit XPathDeadline(Clock::time_point end);
    XPathDeadline(const XPathDeadline&) = delete;
    XPathDeadline& operator=(const XPathDeadline&) = delete;
    ~XPathDeadline();

    /// The share, from 0 to 1, of the steps of an evaluation that fits into the time left; 1 without a
    /// deadline.
    static double shareOfSteps();

  private:
    Clock::time_point former_;
};

}  // namespace qvct
