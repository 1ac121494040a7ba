#include "platform/data/XmlDocument.h"

#include <gtest/gtest.h>

namespace qvct {
namespace {

TEST(XmlTree, OfNothingIsRefusedWithAReason) {
    Error error;
    EXPECT_EQ(XmlDocument::fromText({}, "empty.xml", &error), nullptr);
    EXPECT_NE(error.message(), "empty.xml: ");
    EXPECT_TRUE(error.isSet());
}

}  // namespace
}  // namespace qvct
