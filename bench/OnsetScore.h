#pragma once

#include <cstddef>
#include <vector>

namespace qvct::bench {

/// How well found onsets match the true ones, summed over any number of recordings.
class OnsetScore {
  public:
    explicit OnsetScore(double tolerance) : tolerance_(tolerance) {}

    /// Each true onset matches at most one found, in the order of time; both lists in seconds, ascending.
    void add(const std::vector<double>& truth, const std::vector<double>& found) {
        truth_ += truth.size();
        found_ += found.size();
        for (std::size_t t = 0, f = 0; t < truth.size() && f < found.size();) {
            const double offset = found[f] - truth[t];
            if (offset < -tolerance_) {
                ++f;
            } else if (offset > tolerance_) {
                ++t;
            } else {
                ++hits_, ++t, ++f;
                offsets_ += offset;
            }
        }
    }

    double precision() const { return found_ ? double(hits_) / double(found_) : 0; }
    double recall() const { return truth_ ? double(hits_) / double(truth_) : 0; }
    double f() const { return truth_ + found_ ? 2 * double(hits_) / double(truth_ + found_) : 0; }
    /// Seconds that the matched onsets are found late.
    double meanOffset() const { return hits_ ? offsets_ / double(hits_) : 0; }

  private:
    double tolerance_;
    double offsets_ = 0;
    std::size_t truth_ = 0, found_ = 0, hits_ = 0;
};

}  // namespace qvct::bench
