#include "listening/rhythm/FractalComplexity.h"

#include "listening/rhythm/NoteLookup.h"

#include <array>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <span>

namespace qvct {
namespace {

constexpr double kPerVelocity = 1.0 / 127;

using Interval = FractalComplexity::Interval;

float integralTo(float end, float start) {
    const auto antiderivative = [](float x) { return double(x + x) - double(x) * double(x); };
    return static_cast<float>(antiderivative(end) - antiderivative(start));
}

// Truncated towards zero; a quotient that is not a number or beyond an integer counts as no cells at all.
int cellCount(const Interval& interval, double resolution) {
    const double cells = (interval.second - interval.first) / resolution;
    return std::abs(cells) <= std::numeric_limits<int>::max() ? static_cast<int>(cells) : 0;
}

float pairDifference(int a, int b) {
    return static_cast<float>(std::abs(double(a) - b) * kPerVelocity);
}

float tripleTerm(int a, int b) {
    return static_cast<float>(std::abs(double(a) - b) * kPerVelocity / 3);
}

// The parts of one interval. Their width is rounded to single precision once, so that all parts are equal.
void appendParts(std::vector<Interval>& parts, double start, float width, std::int32_t count) {
    for (std::int32_t k = 0; k < count; ++k) {
        const double from = start + static_cast<double>(static_cast<float>(k) * width);
        parts.emplace_back(from, from + static_cast<double>(width));
    }
}

}  // namespace

struct FractalComplexity::Hierarchy {
    std::span<const std::int32_t> divisions;
    std::span<const double> resolutions;
    std::span<const float> weights;
};

float FractalComplexity::computeComplexity(const std::vector<Note>& notes, double length,
                                           const std::vector<std::int32_t>& divisions,
                                           const std::vector<double>& resolutions,
                                           const std::vector<float>& weights,
                                           std::vector<float>* levelScores) const {
    if (levelScores) levelScores->clear();
    if (divisions.empty() || resolutions.size() != divisions.size() || weights.size() != divisions.size()) {
        return 0;
    }
    std::vector<Interval> intervals;
    if (divisions[0] >= 1) appendParts(intervals, 0, static_cast<float>(length / divisions[0]), divisions[0]);

    const float sum =
        complexityFrom(NoteLookup(notes), intervals, 0, {divisions, resolutions, weights}, levelScores);
    float totalWeight = 0;
    for (const float weight : weights) totalWeight += weight;
    return sum / totalWeight;
}

float FractalComplexity::computeComplexity(const std::vector<Note>& notes,
                                           const std::vector<Interval>& intervals, int level,
                                           const std::vector<std::int32_t>& divisions,
                                           const std::vector<double>& resolutions,
                                           const std::vector<float>& weights) const {
    return complexityFrom(NoteLookup(notes), intervals, static_cast<std::size_t>(level),
                          {divisions, resolutions, weights}, nullptr);
}

float FractalComplexity::complexityFrom(const NoteLookup& notes, const std::vector<Interval>& intervals,
                                        std::size_t level, const Hierarchy& hierarchy,
                                        std::vector<float>* levelScores) {
    const std::int32_t division = hierarchy.divisions[level];
    const std::size_t groupSize = division > 0 ? static_cast<std::size_t>(division) : 0;
    float sum = 0;
    for (std::size_t i = 0; groupSize > 0 && i < intervals.size(); i += groupSize) {
        sum += groupDistance(notes, intervals, i, division, hierarchy.resolutions[level]);
    }
    // Without an interval this is 0/0 on purpose: such a hierarchy has no score.
    const std::size_t groups = groupSize > 0 ? intervals.size() / groupSize : 0;
    const float mean = sum / static_cast<float>(groups);
    const float score = mean * hierarchy.weights[level];
    if (levelScores) levelScores->push_back(mean);
    if (level + 1 >= hierarchy.divisions.size()) return score;

    std::vector<Interval> parts;
    const std::int32_t next = hierarchy.divisions[level + 1];
    for (const auto& [start, end] : intervals) {
        if (next >= 1) appendParts(parts, start, static_cast<float>((end - start) / next), next);
    }
    return complexityFrom(notes, parts, level + 1, hierarchy, levelScores) + score;
}

float FractalComplexity::distance(const std::vector<Note>& notes, const std::vector<Interval>& intervals,
                                  int first, int groupSize, double resolution) const {
    return groupDistance(NoteLookup(notes), intervals, static_cast<std::size_t>(first), groupSize,
                         resolution);
}

float FractalComplexity::groupDistance(const NoteLookup& notes, const std::vector<Interval>& intervals,
                                       std::size_t first, int groupSize, double resolution) {
    const int cells = cellCount(intervals[first], resolution);
    float sum = 0;
    const bool compared =
        (groupSize == 2 || groupSize == 3) && intervals.size() - first >= static_cast<std::size_t>(groupSize);
    for (int cell = 0; compared && cell < cells; ++cell) {
        const double offset = cell * resolution;
        std::array<int, 3> v{};
        for (std::size_t k = 0; k < static_cast<std::size_t>(groupSize); ++k) {
            const double from = intervals[first + k].first + offset;
            v[k] = notes.velocityIn(from, from + resolution);
        }
        if (groupSize == 2) {
            sum += pairDifference(v[0], v[1]);
        } else {
            sum += tripleTerm(v[1], v[0]);
            sum += tripleTerm(v[1], v[2]);
            sum += tripleTerm(v[0], v[2]);
        }
    }
    return integralTo(sum / static_cast<float>(cells), 0);
}

float FractalComplexity::definiteIntegralLinearDownward(float a, float b) const {
    return integralTo(b, a);
}

int FractalComplexity::thereExistsANoteInRange(const std::vector<Note>& notes, double from, double to) const {
    for (const Note& note : notes) {
        if (from <= note.startTime && note.startTime < to) return note.velocity;
    }
    return 0;
}

float FractalComplexity::testDistance() const {
    std::vector<Note> notes;
    notes.reserve(16);
    for (int i = 0; i < 16; ++i) notes.push_back({double(i), i + 0.5, 60, 100});
    return distance(notes, {{0, 8}, {8, 16}}, 0, 2, 0.125);
}

}  // namespace qvct
