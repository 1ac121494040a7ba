#include "platform/text/Spelling.h"

#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace qvct {
namespace {

TEST(Spelling, CountsLettersThatDiffer) {
    const struct {
        std::string_view a, b;
        std::size_t distance;
    } rows[] = {{"", "", 0},         {"", "abc", 3},
                {"kick", "Kick", 0}, {"kik", "kick", 1},
                {"kcik", "kick", 1}, {"skick", "kick", 1},
                {"kack", "kick", 1}, {"autotg", "autotag", 1},
                {"ca", "abc", 3},    {"\xc3\xa9t\xc3\xa9", "ete", 2},
                {"kick", "snare", 5}};
    for (const auto& [a, b, distance] : rows) {
        EXPECT_EQ(spellingDistance(a, b), distance) << a << " " << b;
        EXPECT_EQ(spellingDistance(b, a), distance) << b << " " << a;
    }
}

TEST(Spelling, FindsOnlyWhatIsNear) {
    const std::vector<std::string> words = {"index", "inspect", "read", "rules", "House", "Techno"};
    const std::pair<std::string_view, std::string_view> rows[] = {
        {"indx", "index"}, {"rea", "read"}, {"ruels", "rules"}, {"hosue", "House"},
        {"xyzzy", ""},     {"", ""},        {"ab", ""}};
    for (const auto& [word, nearest] : rows) EXPECT_EQ(nearestSpelling(word, words), nearest) << word;
    EXPECT_EQ(nearestSpelling(std::string(1'000'000, 'x'), words), "");
}

}  // namespace
}  // namespace qvct
