#include "listening/rhythm/AgglomerativeClustering.h"
#include "support/ProcessorClock.h"

#include <chrono>
#include <cmath>
#include <limits>
#include <optional>
#include <random>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Clusters = std::vector<std::vector<std::size_t>>;

std::vector<Note> notesAt(const std::vector<double>& starts) {
    std::vector<Note> notes;
    for (const double start : starts) notes.push_back({start, start + 1, 60, 100});
    return notes;
}

// The definition: every pair of clusters, every pair of their notes, after every merge.
Clusters clustersByDefinition(const std::vector<Note>& notes, double threshold) {
    AgglomerativeClustering measure({});
    measure.setThreshold(threshold);
    Clusters clusters;
    for (std::size_t i = 0; i < notes.size(); ++i) clusters.push_back({i});
    while (true) {
        float closest = std::numeric_limits<float>::infinity();
        std::size_t first = 0;
        std::size_t second = 0;
        for (std::size_t i = 0; i < clusters.size(); ++i) {
            for (std::size_t j = i + 1; j < clusters.size(); ++j) {
                float farthest = 0;
                for (const std::size_t a : clusters[i]) {
                    for (const std::size_t b : clusters[j]) {
                        farthest = std::max(
                            farthest,
                            measure.distance(notes[a], notes[b], AgglomerativeClustering::kStartInThreshold));
                    }
                }
                if (farthest < closest) closest = farthest, first = i, second = j;
            }
        }
        if (std::isinf(closest)) break;
        clusters[first].insert(clusters[first].end(), clusters[second].begin(), clusters[second].end());
        clusters.erase(clusters.begin() + static_cast<std::ptrdiff_t>(second));
    }
    for (auto& cluster : clusters) std::sort(cluster.begin(), cluster.end());
    std::sort(clusters.begin(), clusters.end());
    return clusters;
}

Clusters clustersOf(const std::vector<Note>& notes, double threshold) {
    AgglomerativeClustering clustering(notes);
    clustering.setThreshold(threshold);
    clustering.runAnalysis(AgglomerativeClustering::kStartInThreshold);
    return clustering.clusters();
}

TEST(AgglomerativeClustering, AgreesWithTheDefinition) {
    std::mt19937 random(7);
    for (int round = 0; round < 300; ++round) {
        // Half of the rounds on a coarse grid and out of order, so that many distances are equal.
        std::uniform_int_distribution<int> ticks(0, round % 2 == 0 ? 24 : 4000);
        std::vector<double> starts;
        for (int i = 0; i < 2 + round % 23; ++i)
            starts.push_back(ticks(random) / (round % 2 == 0 ? 16.0 : 1000.0));
        if (round % 3 == 0) std::sort(starts.begin(), starts.end());
        const auto notes = notesAt(starts);
        EXPECT_EQ(clustersOf(notes, 0.125), clustersByDefinition(notes, 0.125)) << "round " << round;
    }
}

TEST(AgglomerativeClustering, MeasuresByFourMethods) {
    const AgglomerativeClustering clustering({});
    const Note a{0, 4, 60, 100}, b{3, 8, 60, 100}, c{8, 9, 60, 100}, instant{3, 3, 60, 100};
    EXPECT_EQ(clustering.distance(a, b, AgglomerativeClustering::kStart), 3);
    EXPECT_TRUE(std::isinf(clustering.distance(a, b, AgglomerativeClustering::kStartInThreshold)));
    EXPECT_EQ(clustering.distance(a, b, AgglomerativeClustering::kStartAndEnd), 5);
    EXPECT_FLOAT_EQ(clustering.distance(a, b, AgglomerativeClustering::kOverlap), 1 - (0.25F + 0.2F) / 2);
    EXPECT_EQ(clustering.distance(b, c, AgglomerativeClustering::kOverlap), 1);
    EXPECT_EQ(clustering.distance(a, instant, AgglomerativeClustering::kOverlap), 1);
}

TEST(AgglomerativeClustering, FiniteDistancesEndInOneClusterAndEndlessTimesStayAlone) {
    const double infinite = std::numeric_limits<double>::infinity();
    AgglomerativeClustering clustering(notesAt({5, infinite, 0, std::nan(""), 100}));
    for (const auto method : {AgglomerativeClustering::kStart, AgglomerativeClustering::kStartAndEnd,
                              AgglomerativeClustering::kOverlap}) {
        clustering.runAnalysis(method);
        EXPECT_EQ(clustering.clusters(), (Clusters{{0, 2, 4}, {1}, {3}}));
    }
}

TEST(AgglomerativeClustering, TenThousandNotesAreQuick) {
    // Far apart, dense, and all at once: each has been the slow case of some implementation.
    for (const double spread : {10000.0, 10.0, 0.0}) {
        std::mt19937 random(3);
        std::uniform_real_distribution<double> time(0, spread);
        std::vector<double> starts;
        for (int i = 0; i < 10000; ++i) starts.push_back(spread > 0 ? time(random) : 1.0);
        const auto notes = notesAt(starts);
        const auto begin = test::ProcessorClock::now();
        clustersOf(notes, 0.125);
        EXPECT_LT(test::ProcessorClock::now() - begin, std::chrono::milliseconds(500)) << spread;
    }
}

}  // namespace
}  // namespace qvct
