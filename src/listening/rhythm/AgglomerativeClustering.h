#pragma once

#include "listening/rhythm/Note.h"

#include <cstddef>
#include <vector>

namespace qvct {

/// Clusters of notes that belong together, closest pair first (complete linkage: the distance of two clusters
/// is that of their farthest pair). Of equally close pairs the one whose notes come first in the vector is
/// merged first. Merging goes on until the smallest distance left is infinite.
class AgglomerativeClustering {
  public:
    /// The distance of two notes.
    enum Method {
        kStart = 0,             ///< Difference of the starts.
        kStartInThreshold = 1,  ///< Difference of the starts, infinite beyond the threshold.
        kStartAndEnd = 2,       ///< Euclidean distance of (start, end).
        kOverlap = 3  ///< 1 minus half the sum of the shares of each note that overlap; 1 without any.
    };

    explicit AgglomerativeClustering(std::vector<Note> notes);

    /// Largest distance, in beats, that `kStartInThreshold` can bridge. 1 unless set.
    void setThreshold(double beats) { threshold_ = beats; }
    /// The distance of two notes, in single precision.
    float distance(const Note& a, const Note& b, Method method) const;

    /// Finds the clusters. Only `kStartInThreshold` has infinite distances between notes of finite times, so
    /// the other methods end with one cluster of them all. A note whose times are not finite stays by itself.
    ///
    /// @cost  O(n log n) time, O(n) memory.
    void runAnalysis(Method method);

    /// The clusters of the last run as places in the vector, each ascending, in the order of their first
    /// notes.
    const std::vector<std::vector<std::size_t>>& clusters() const { return clusters_; }
    /// The note that starts first in each cluster (of several, the first in the vector), in the clusters'
    /// order.
    std::vector<Note> getReducedRepresentationEarliestNotes() const;

  private:
    std::vector<Note> notes_;
    double threshold_ = 1.0;
    std::vector<std::vector<std::size_t>> clusters_;
};

}  // namespace qvct
