#include "taxonomy/labels/TagNormalization.h"

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Steps = std::vector<std::string>;

TEST(TagNormalization, ReadsEveryMarker) {
    struct {
        const char* raw;
        const char* label;
        int type;
        int steps;
        std::optional<Steps> names;
    } const cases[] = {
        {"Bright / Dark-+", "Bright / Dark", 2, 2, Steps{"Bright", "Dark"}},
        {"Bright / Dark{Bright,Dark}", "Bright / Dark", 2, 2, Steps{"Bright", "Dark"}},
        {"Tempo$5", "Tempo", 3, 5, std::nullopt},
        {"Loose / Tight[Sloppy,Loose,Tight,Quantized]", "Loose / Tight", 3, 4,
         Steps{"Sloppy", "Loose", "Tight", "Quantized"}},
        // The blank behind the comma stays.
        {"Swing[Moderate Swing, Heavy Swing]", "Swing", 3, 2, Steps{"Moderate Swing", " Heavy Swing"}},
        {"Swing [a,b]", "Swing ", 3, 2, Steps{"a", "b"}},
        {"12^Fast Attack", "Fast Attack", 0, 0, std::nullopt},
        {"Loudness%", "Loudness", 1, 0, std::nullopt},
        {"Featured!", "Featured", 4, 0, std::nullopt},
        {"Drum'n'Bass", "Drum'n'Bass", 0, 0, std::nullopt},
        {"R&B", "R&B", 0, 0, std::nullopt},
        // Markers go wherever they stand; the type only looks at the end.
        {"50% Off", "50 Off", 0, 0, std::nullopt},
        {"Cost $5 or so", "Cost $5 or so", 0, 0, std::nullopt},
        // From the first opening to the last closing one; a closing one alone is none.
        {"A[b]c[d]", "A", 3, 1, Steps{"b]c[d"}},
        {"a]b[c", "a]b[c", 0, 0, std::nullopt},
        {"Warm-+[x,y]", "Warm", 3, 2, Steps{"x", "y"}},
        {"", "", 0, 0, std::nullopt},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(normalizedTagString(c.raw), c.label) << c.raw;
        EXPECT_EQ(tagValueType(c.raw), c.type) << c.raw;
        EXPECT_EQ(numberOfTagValueSteps(c.raw), c.steps) << c.raw;
        EXPECT_EQ(tagStepLabels(c.raw), c.names) << c.raw;
    }
}

TEST(TagNormalization, SplitsLabelAndLevel) {
    struct {
        const char* text;
        const char* label;
        std::optional<double> level;
    } const cases[] = {
        {"Bass", "Bass", std::nullopt},
        {"  Deep House (1) ", "Deep House", 1.0},
        {"Warm (0.75)", "Warm", 0.75},
        {"Warm(0.75)", "Warm", 0.75},
        {"(0.5)", "(0.5)", std::nullopt},
        {"X(1)", "X(1)", std::nullopt},  // the label needs two characters
        {"XY(1)", "XY", 1.0},
        {"Warm (high)", "Warm (high)", std::nullopt},
        {"Warm (-0.5)", "Warm (-0.5)", std::nullopt},
        {"A (1) (0.5)", "A (1)", 0.5},
        {"A (1.2.3)", "A", 1.2},
        {"line\nbreak (1)", "line\nbreak (1)", std::nullopt},
        {"", "", std::nullopt},
    };
    for (const auto& c : cases) {
        std::optional<double> level = 99;
        EXPECT_EQ(labelFromString(c.text, &level), c.label) << c.text;
        EXPECT_EQ(level, c.level) << c.text;
    }
}

}  // namespace
}  // namespace qvct
