#include "output/pictures/RhythmPlot.h"

#include <cmath>
#include <limits>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

std::size_t count(const std::string& text, std::string_view part) {
    std::size_t found = 0;
    for (auto at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) ++found;
    return found;
}

RhythmPlot fourBeats() {
    RhythmPlot plot;
    plot.title = "R&B <loop>";
    plot.tempo = 120;
    plot.beatCount = plot.signatureTop = plot.signatureBottom = 4;
    plot.onsets = {0, 1.5, 3, 4, -1};
    plot.metricWeights.assign(32, 0.5F);
    plot.divisions = {2, 2};
    plot.levelScores = {0.25F, 0.75F};
    return plot;
}

TEST(RhythmPlot, DrawsGridOnsetsWeightsAndLevels) {
    const std::string svg = fourBeats().svg();
    EXPECT_EQ(count(svg, "stroke=\"#d0342c\""), 3U) << "onsets outside of the loop are not drawn";
    EXPECT_EQ(count(svg, "stroke=\"#ddd\""), 4U * 7) << "cell lines between the beats";
    EXPECT_EQ(count(svg, "stroke=\"#666\""), 2U) << "bar lines";
    EXPECT_EQ(count(svg, "fill=\"#bbb\""), 29U);
    EXPECT_EQ(count(svg, "fill=\"#d0342c\""), 3U) << "cells with an onset";
    EXPECT_THAT(svg, testing::HasSubstr("R&amp;B &lt;loop&gt;"));
    EXPECT_THAT(svg, testing::HasSubstr("2 parts of 1 beats"));
    EXPECT_THAT(svg, testing::HasSubstr("0.750"));
}

TEST(RhythmPlot, MarksTheCellThatAnOnsetCountsFor) {
    const auto marked = [](double onset) {
        RhythmPlot plot = fourBeats();
        plot.onsets = {onset};
        const std::string svg = plot.svg(), colour = "fill=\"#d0342c\"";
        const auto end = svg.find(colour);
        return end == std::string::npos ? "" : svg.substr(svg.rfind('<', end), 16);
    };
    EXPECT_EQ(marked(0.4999), marked(0.5));
    EXPECT_EQ(marked(0.5625), marked(0.5));
    EXPECT_EQ(marked(0.563), marked(0.625));
    EXPECT_NE(marked(0.5), marked(0.625));
    EXPECT_EQ(marked(3.99), "") << "counts for the beat behind the loop";
}

TEST(RhythmPlot, DrawsAWaveformOrElseAPianoRoll) {
    RhythmPlot plot = fourBeats();
    plot.notes = {{0, 0.5, 36, 127}, {1, 0.5, 38, 64}, {9, 10, 40, 1}};
    EXPECT_EQ(count(plot.svg(), "fill=\"#4a7ab5\""), 2U);
    EXPECT_EQ(count(plot.svg(), "fill-opacity=\"0.63\""), 1U);
    plot.waveform.assign(5000, {-0.5F, 0.5F});
    const std::string svg = plot.svg();
    EXPECT_EQ(count(svg, "fill-opacity"), 0U);
    EXPECT_EQ(count(svg, "height=\"100.00\" fill=\"#4a7ab5\""), 1120U) << "one column a pixel";
}

TEST(RhythmPlot, LeavesOutWhatIsNotFiniteAndStaysSmall) {
    const float nan = std::nanf("");
    const double infinite = std::numeric_limits<double>::infinity();
    for (const int beats : {-1, 0, 1, 1000, std::numeric_limits<int>::max()}) {
        RhythmPlot plot = fourBeats();
        plot.beatCount = beats;
        plot.onsets = {std::nan(""), infinite, 0.5};
        plot.notes = {{0, infinite, 36, 127}, {std::nan(""), 1, 36, 500}};
        plot.metricWeights = {nan, 1};
        plot.levelScores = {nan};
        std::string svg = plot.svg();
        plot.waveform = {{nan, nan}, {-9, 9}};
        svg += plot.svg();
        EXPECT_EQ(count(svg, "=\"nan") + count(svg, "=\"-nan") + count(svg, "=\"inf"), 0U) << beats;
        EXPECT_LT(svg.size(), 1U << 20) << beats;
    }
}

}  // namespace
}  // namespace qvct
