#include "platform/base/Log.h"
#include "resources/EmbeddedFiles.h"
#include "resources/QVCTCompiledResources.h"
#include "support/Places.h"

#include <fstream>
#include <iterator>

#include <gmock/gmock.h>

namespace qvct {
namespace {

std::span<const unsigned char> bytesOf(std::string_view text) {
    return {reinterpret_cast<const unsigned char*>(text.data()), text.size()};
}

TEST(CompiledResources, HoldTheFilesToTheByte) {
    struct {
        const char* file;
        const unsigned char* bytes;
        std::uint32_t length;
    } const cases[] = {
        {"DefaultTaxonomy.plist", DefaultTaxonomy_plist, DefaultTaxonomy_plist_len},
        {"LegacyLoopTaxonomyMapping.csv", LegacyLoopTaxonomyMapping_csv, LegacyLoopTaxonomyMapping_csv_len},
        {"QVSearchKit.js", QVSearchKit_js, QVSearchKit_js_len},
    };
    for (const auto& c : cases) {
        std::ifstream file(std::string(QVCT_SOURCE "/src/resources/data/") + c.file, std::ios::binary);
        const std::string wanted((std::istreambuf_iterator<char>(file)), {});
        EXPECT_EQ(std::string(reinterpret_cast<const char*>(c.bytes), c.length), wanted) << c.file;
    }
}

TEST(CompiledResources, ConvertByKind) {
    using R = QVCTCompiledResources;
    std::vector<std::string> lines;
    const LogHandler before =
        setLogHandler([&lines](std::string_view message) { lines.emplace_back(message); });
    EXPECT_EQ(R::compiledResourceWithData({}, R::kText).index(), 0U);
    setLogHandler(before);
    EXPECT_THAT(lines, testing::ElementsAre("No data"));

    const auto text = R::compiledResourceWithData(bytesOf("a\r\nb\n"), R::kTextLines);
    EXPECT_EQ(std::get<R::Lines>(text), (R::Lines{"a\r", "b", ""}));
    EXPECT_EQ(R::compiledResourceWithData(bytesOf("a"), 3).index(), 0U);
    EXPECT_EQ(R::compiledResourceWithData(bytesOf("\xff"), R::kText).index(), 0U);
    EXPECT_EQ(R::compiledResourceWithData(bytesOf("<plist>"), R::kPropertyList).index(), 0U);
}

}  // namespace
}  // namespace qvct
