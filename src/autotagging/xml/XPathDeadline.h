#pragma once

#include <chrono>

namespace qvct {

/// While one lives, expressions that its thread evaluates take no more steps than fit into the time until
/// then. Deadlines may be nested: the earliest counts.
class XPathDeadline {
  public:
    using Clock = std::chrono::steady_clock;

    explicit XPathDeadline(Clock::time_point end);
    XPathDeadline(const XPathDeadline&) = delete;
    XPathDeadline& operator=(const XPathDeadline&) = delete;
    ~XPathDeadline();

    /// Which share of all steps that an evaluation may take fits into the time left, from 0 to 1; 1 without a
    /// deadline.
    static double shareOfSteps();

  private:
    Clock::time_point former_;
};

}  // namespace qvct
