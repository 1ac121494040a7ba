#include "listening/rhythm/FractalComplexity.h"

#include <cmath>

#include <gtest/gtest.h>

namespace qvct {
namespace {

std::vector<Note> notesAt(std::initializer_list<std::pair<double, int>> starts) {
    std::vector<Note> notes;
    for (const auto& [start, velocity] : starts) notes.push_back({start, start + 0.1, 60, velocity});
    return notes;
}

TEST(FractalComplexity, ScoresHalvesByTheirDifference) {
    const FractalComplexity fractal;
    const std::vector<FractalComplexity::Interval> halves = {{0, 1}, {1, 2}};
    const auto distance = [&](const std::vector<Note>& notes) {
        return fractal.distance(notes, halves, 0, 2, 0.5);
    };
    EXPECT_EQ(distance(notesAt({{0, 90}, {1, 90}})), 0);
    EXPECT_EQ(distance(notesAt({{0, 127}, {0.5, 127}})), 1);
    EXPECT_FLOAT_EQ(distance(notesAt({{0, 127}})), 0.75F);
    EXPECT_FLOAT_EQ(distance(notesAt({{0.5, 127}})), 0.75F)
        << "a note on a cell's end belongs to the next cell";
    EXPECT_FLOAT_EQ(distance(notesAt({{1.6, 90}, {0.5, 127}, {0, 127}})),
                    distance(notesAt({{0, 127}, {0.5, 127}, {1.6, 90}})))
        << "the order of the notes does not matter";
    EXPECT_EQ(distance(notesAt({{-0.1, 127}, {2, 127}})), 0) << "notes outside belong to none";
    EXPECT_EQ(distance(notesAt({{0.2, 10}, {0.1, 127}, {1, 10}})), 0) << "the first in the vector counts";
    EXPECT_EQ(fractal.testDistance(), 0);
}

TEST(FractalComplexity, ComparesThreeSiblingsPairwiseAndNoOtherGroups) {
    const FractalComplexity fractal;
    const std::vector<FractalComplexity::Interval> parts = {{0, 1}, {1, 2}, {2, 3}, {3, 4}};
    const std::vector<Note> notes = notesAt({{1, 127}});
    EXPECT_FLOAT_EQ(fractal.distance(notes, parts, 0, 3, 1), 1 - 1.0F / 9);
    EXPECT_EQ(fractal.distance(notes, parts, 0, 4, 1), 0);
    EXPECT_EQ(fractal.distance(notes, parts, 3, 2, 1), 0) << "a group that the list cuts short";
    EXPECT_TRUE(std::isnan(fractal.distance(notes, parts, 0, 2, 2)))
        << "no cell fits into the first interval";
}

TEST(FractalComplexity, WeighsLevelsAndRefusesUnequalVectors) {
    const FractalComplexity fractal;
    const std::vector<Note> notes = notesAt({{0, 127}, {0.5, 127}});
    std::vector<float> scores;
    EXPECT_FLOAT_EQ(fractal.computeComplexity(notes, 2, {2, 4}, {0.5, 0.125}, {3, 1}, &scores), 0.75F)
        << "a group of four scores 0 and weighs";
    EXPECT_EQ(scores, (std::vector<float>{1, 0}));
    EXPECT_FLOAT_EQ(fractal.computeComplexity(notes, {{0, 1}, {1, 2}}, 0, {2}, {0.5}, {3}), 3);
    EXPECT_EQ(fractal.computeComplexity(notes, 2, {}, {}, {}), 0);
    EXPECT_EQ(fractal.computeComplexity(notes, 2, {2, 2}, {0.5}, {1, 1}), 0);
    EXPECT_EQ(fractal.computeComplexity(notes, 2, {2}, {0.5}, {1, 1}), 0);
    EXPECT_TRUE(std::isnan(fractal.computeComplexity(notes, 2, {0}, {0.5}, {1})));
    EXPECT_TRUE(std::isnan(fractal.computeComplexity(notes, 2, {2, 0}, {0.5, 0.5}, {1, 1})));
}

TEST(FractalComplexity, IntegratesTheFallingLine) {
    const FractalComplexity fractal;
    EXPECT_EQ(fractal.definiteIntegralLinearDownward(0, 1), 1);
    EXPECT_FLOAT_EQ(fractal.definiteIntegralLinearDownward(0.5F, 1), 0.25F);
}

TEST(FractalComplexity, FindsTheFirstNoteInARange) {
    const FractalComplexity fractal;
    const std::vector<Note> notes = notesAt({{1.5, 5}, {1, 7}, {2, 9}});
    EXPECT_EQ(fractal.thereExistsANoteInRange(notes, 1, 2), 5);
    EXPECT_EQ(fractal.thereExistsANoteInRange(notes, 1.6, 2), 0);
}

}  // namespace
}  // namespace qvct
