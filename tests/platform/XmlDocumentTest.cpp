#include "platform/data/xml/XmlDocument.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace qvct {
namespace {

TEST(XmlTree, OfNothingIsRefusedWithAReason) {
    Error error;
    EXPECT_EQ(XmlDocument::fromText({}, "empty.xml", &error), nullptr);
    EXPECT_NE(error.message(), "empty.xml: ");
    EXPECT_TRUE(error.isSet());
}

TEST(XmlTree, OfDamagedDataIsRefusedWithItsPath) {
    const test::TemporaryFolder folder;
    const std::string path = folder.write("a.zxml", "<P/>");
    Error error;
    EXPECT_EQ(XmlDocument::fromFile(path, &error), nullptr);
    EXPECT_EQ(error.message(), path + ": neither gzip nor zlib nor Zstandard data");
}

TEST(XmlTree, GivesTheAttributesOfWhatIsSelectedInDocumentOrder) {
    const auto tree = XmlDocument::fromText("<P><a n='1'/><b n='2'/><a/><b n='4'/><c n='5'/></P>", "a.xml");
    const std::pair<const char*, std::vector<std::string>> cases[] = {
        {"/P/b | /P/a", {"1", "2", "", "4"}},
        {"/P/c/preceding-sibling::*", {"1", "2", "", "4"}},
        {"(/P/c | /P/b)[@n > 2] | /P/a[1]", {"1", "4", "5"}},
        {"/P/a/@n", {""}},
        {"count(/P/a)", {}},
    };
    for (const auto& [xpath, values] : cases) EXPECT_EQ(tree->attributeValues(xpath, "n"), values) << xpath;
}

}  // namespace
}  // namespace qvct
