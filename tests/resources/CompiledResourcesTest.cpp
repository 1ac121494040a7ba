#include "resources/EmbeddedFiles.h"
#include "resources/QVCTCompiledResources.h"
#include "support/CapturedLog.h"
#include "support/Places.h"
#include "support/TemporaryFolder.h"

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
        EXPECT_EQ(std::string(reinterpret_cast<const char*>(c.bytes), c.length),
                  test::readAll(std::string(QVCT_SOURCE "/src/resources/data/") + c.file));
    }
}

TEST(CompiledResources, ConvertByKind) {
    using R = QVCTCompiledResources;
    const test::CapturedLog log;
    EXPECT_EQ(R::compiledResourceWithData({}, R::kText).index(), 0U);
    EXPECT_THAT(log.messages(), testing::ElementsAre("No data"));
    const auto text = R::compiledResourceWithData(bytesOf("a\r\nb\n"), R::kTextLines);
    EXPECT_EQ(std::get<R::Lines>(text), (R::Lines{"a\r", "b", ""}));
    EXPECT_EQ(R::compiledResourceWithData(bytesOf("a"), 3).index(), 0U);
    EXPECT_EQ(R::compiledResourceWithData(bytesOf("\xff"), R::kText).index(), 0U);
    EXPECT_EQ(R::compiledResourceWithData(bytesOf("<plist>"), R::kPropertyList).index(), 0U);
}

}  // namespace
}  // namespace qvct
