#pragma once

#include "listening/rhythm/Note.h"

#include <cstddef>
#include <utility>
#include <vector>

namespace qvct {

/// Finds the first note, in the order of a vector, that starts within a span of time.
///
/// Gives what a scan from the vector's start gives, without the scan: the starts are sorted once.
/// The notes must outlive it and stay as they are. Notes whose start is not a number are never found.
///
/// @cost  O(n log n) to make, O(log n + notes in the span) for one question.
class NoteLookup {
  public:
    explicit NoteLookup(const std::vector<Note>& notes);

    /// The first note with from <= startTime < to; null when there is none.
    const Note* firstIn(double from, double to) const;
    /// Its velocity, or 0.
    int velocityIn(double from, double to) const;

  private:
    const std::vector<Note>& notes_;
    std::vector<std::pair<double, std::size_t>> starts_;  // sorted; with the place in the vector
};

}  // namespace qvct
