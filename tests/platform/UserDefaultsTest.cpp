#include "platform/data/UserDefaults.h"

#include <cstdlib>

#include <gtest/gtest.h>

namespace qvct {
namespace {

TEST(UserDefaults, AreTakenFromTheEnvironmentUntilTheyAreSet) {
    EXPECT_FALSE(UserDefaults::boolForKey("tested"));
    for (const auto& [text, value] :
         {std::pair{"1", true}, {"yes", true}, {"true", true}, {"0", false}, {"no", false}}) {
        ::setenv("QVCT_DEFAULT_tested", text, 1);
        EXPECT_EQ(UserDefaults::boolForKey("tested"), value) << text;
    }
    ::setenv("QVCT_DEFAULT_set", "1", 1);
    UserDefaults::setBool(false, "set");
    EXPECT_FALSE(UserDefaults::boolForKey("set"));
    for (const char* name : {"QVCT_DEFAULT_tested", "QVCT_DEFAULT_set"}) ::unsetenv(name);
}

}  // namespace
}  // namespace qvct
