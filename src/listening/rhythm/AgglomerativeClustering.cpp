#include "listening/rhythm/AgglomerativeClustering.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <queue>
#include <tuple>
#include <utility>

namespace qvct {
namespace {

constexpr float kInfinity = std::numeric_limits<float>::infinity();

float startDistance(const Note& a, const Note& b) {
    return static_cast<float>(std::abs(a.startTime - b.startTime));
}

float overlapDistance(const Note& a, const Note& b) {
    const double shared = std::min(a.endTime, b.endTime) - std::max(a.startTime, b.startTime);
    const double lengthA = a.endTime - a.startTime;
    const double lengthB = b.endTime - b.startTime;
    if (!(shared > 0) || !(lengthA > 0) || !(lengthB > 0)) return 1;
    return static_cast<float>(1 - (shared / lengthA + shared / lengthB) / 2);
}

// Notes on the line of time. The closest of all pairs of clusters is always one of neighbours, since the span
// of a pair holds the span of every pair in between; so only neighbours are looked at.
class Timeline {
  public:
    Timeline(const std::vector<Note>& notes, const std::vector<std::size_t>& order, double threshold)
        : notes_(notes), threshold_(threshold) {
        runs_.reserve(order.size());
        for (const std::size_t note : order) {
            runs_.push_back({{note}, note, note, note, runs_.size() - 1, runs_.size() + 1});
        }
    }

    std::vector<std::vector<std::size_t>> merged() {
        for (std::size_t i = 0; i + 1 < runs_.size(); ++i) offer(i, i + 1);
        while (!queue_.empty()) {
            const Candidate best = queue_.top();
            queue_.pop();
            if (isCurrent(best)) merge(best.left, best.right);
        }
        std::vector<std::vector<std::size_t>> clusters;
        for (Run& run : runs_) {
            if (!run.notes.empty()) clusters.push_back(std::move(run.notes));
        }
        return clusters;
    }

  private:
    // Neighbouring notes in one cluster. An empty one was merged into the run on its left.
    struct Run {
        std::vector<std::size_t> notes;
        std::size_t earliest, latest, lowest;  // by start, by start, by place in the vector
        std::size_t previous, next;
        std::size_t version = 0;
    };
    struct Candidate {
        float distance;
        std::pair<std::size_t, std::size_t> places;  // in the vector, for equal distances
        std::size_t left, right, versions;

        bool operator>(const Candidate& other) const {
            return std::tie(distance, places) > std::tie(other.distance, other.places);
        }
    };

    // Versions only grow, and a run that takes in another gets a new one; so an equal sum means that both
    // runs are unchanged.
    bool isCurrent(const Candidate& pair) const {
        return !runs_[pair.left].notes.empty() &&
               runs_[pair.left].version + runs_[pair.right].version == pair.versions;
    }

    void offer(std::size_t left, std::size_t right) {
        const Run &a = runs_[left], &b = runs_[right];
        const float distance = startDistance(notes_[a.earliest], notes_[b.latest]);
        if (!(distance <= threshold_) || distance == kInfinity) return;
        queue_.push({distance, std::minmax(a.lowest, b.lowest), left, right, a.version + b.version});
    }

    void merge(std::size_t left, std::size_t right) {
        Run &a = runs_[left], &b = runs_[right];
        if (a.notes.size() < b.notes.size()) a.notes.swap(b.notes);
        a.notes.insert(a.notes.end(), b.notes.begin(), b.notes.end());
        b.notes = {};
        a.latest = b.latest;
        a.lowest = std::min(a.lowest, b.lowest);
        a.next = b.next;
        ++a.version;
        if (a.next < runs_.size()) {
            runs_[a.next].previous = left;
            offer(left, a.next);
        }
        if (a.previous < runs_.size()) offer(a.previous, left);
    }

    const std::vector<Note>& notes_;
    double threshold_;
    std::vector<Run> runs_;
    std::priority_queue<Candidate, std::vector<Candidate>, std::greater<>> queue_;
};

}  // namespace

AgglomerativeClustering::AgglomerativeClustering(std::vector<Note> notes) : notes_(std::move(notes)) {}

float AgglomerativeClustering::distance(const Note& a, const Note& b, Method method) const {
    switch (method) {
        case kStart:
            return startDistance(a, b);
        case kStartInThreshold: {
            const float difference = startDistance(a, b);
            if (difference <= threshold_) return difference;
            return kInfinity;
        }
        case kStartAndEnd:
            return static_cast<float>(std::hypot(a.startTime - b.startTime, a.endTime - b.endTime));
        case kOverlap:
            return overlapDistance(a, b);
    }
    return kInfinity;
}

void AgglomerativeClustering::runAnalysis(Method method) {
    clusters_.clear();
    std::vector<std::size_t> finite;
    for (std::size_t i = 0; i < notes_.size(); ++i) {
        if (std::isfinite(notes_[i].startTime) && std::isfinite(notes_[i].endTime)) {
            finite.push_back(i);
        } else {
            clusters_.push_back({i});
        }
    }
    if (method == kStartInThreshold) {
        std::stable_sort(finite.begin(), finite.end(), [this](std::size_t a, std::size_t b) {
            return notes_[a].startTime < notes_[b].startTime;
        });
        for (auto& cluster : Timeline(notes_, finite, threshold_).merged()) {
            std::sort(cluster.begin(), cluster.end());
            clusters_.push_back(std::move(cluster));
        }
    } else if (!finite.empty()) {
        clusters_.push_back(std::move(finite));
    }
    std::sort(clusters_.begin(), clusters_.end());
}

std::vector<Note> AgglomerativeClustering::getReducedRepresentationEarliestNotes() const {
    std::vector<Note> reduced;
    reduced.reserve(clusters_.size());
    for (const auto& cluster : clusters_) {
        const auto earliest = std::min_element(
            cluster.begin(), cluster.end(),
            [this](std::size_t a, std::size_t b) { return notes_[a].startTime < notes_[b].startTime; });
        reduced.push_back(notes_[*earliest]);
    }
    return reduced;
}

}  // namespace qvct
