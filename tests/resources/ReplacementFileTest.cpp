#include "autotagging/ResourceFiles.h"
#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "autotagging/services/QVCTXMLRulesTaggingService.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/ResourceBundle.h"
#include "resources/BuiltInFile.h"
#include "resources/EmbeddedFiles.h"
#include "resources/PackDisplayNames.h"
#include "resources/ReplacementFile.h"
#include "support/CapturedLog.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/legacy/TGRTLegacyTaxonomyMapping.h"

#include <functional>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using Dictionary = PropertyList::Dictionary;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

/// A folder of resources for as long as it lives.
class Resources {
  public:
    Resources() { ResourceBundle::setDirectory(folder_.path()); }
    ~Resources() { ResourceBundle::setDirectory(""); }
    Resources(const Resources&) = delete;
    Resources& operator=(const Resources&) = delete;

    void write(const std::string& name, const std::string& bytes) const { folder_.write(name, bytes); }

  private:
    test::TemporaryFolder folder_;
};

std::string listOf(Dictionary dictionary) {
    return serializePropertyList(std::move(dictionary), PropertyListFormat::xml);
}

/// As beside an installed library; one byte more makes it another file.
TEST(ReplacementFile, IsNoneWhereItIsAsBuiltIn) {
    const Resources resources;
    const std::string bytes(reinterpret_cast<const char*>(DefaultRules_plist), DefaultRules_plist_len);
    Error error;
    resources.write("DefaultRules.plist", bytes);
    EXPECT_FALSE(replacementFile({"DefaultRules", "plist"}, &error));
    EXPECT_FALSE(error.isSet()) << error.message();
    for (const ResourceFile& file : resourceFiles())
        EXPECT_FALSE(builtInFile(file.name, file.extension).empty()) << file.name;
    resources.write("DefaultRules.plist", bytes + "\n");
    EXPECT_TRUE(replacementFile({"DefaultRules", "plist"}, &error)) << error.message();
    resources.write("DefaultRules.plist", std::string(bytes.size(), ' '));
    EXPECT_FALSE(replacementFile({"DefaultRules", "plist"}, &error));
    EXPECT_TRUE(error.isSet());
}

TEST(ReplacementFile, IsUsedWhenItIsWholeElseToldOfOnceAndReplacedByTheBuiltInOne) {
    const struct {
        std::string file, broken, reason, whole;
        std::function<std::size_t()> count;  // of what the host gets
        std::size_t builtIn;
    } rows[] = {
        {"DefaultTaxonomy.plist", listOf({{"Categories", Dictionary{}}}), "there is no key \"categories\"",
         listOf({{"categories", Dictionary{{"Own", Dictionary{{"Tag", Dictionary{}}}}}}}),
         [] { return TGRTTaxonomy::testingTaxonomy()->allTags().size(); }, 618},
        {"LegacyLoopTaxonomy.plist", listOf({{"categories", 1}}), "there are no entries under \"categories\"",
         listOf({{"categories", Dictionary{{"Own", Dictionary{{"Tag", Dictionary{}}}}}}}),
         [] { return TGRTTaxonomy::newTaxonomyOfType(kLegacyLoopTaxonomy, true, false)->allTags().size(); },
         TGRTTaxonomy::newTaxonomyOfType(kLegacyLoopTaxonomy, true, false)->allTags().size()},
        {"DefaultRules.plist", listOf({{"DefaultRules", "x"}}), "there are no entries under \"DefaultRules\"",
         listOf({{"DefaultRules", PropertyList::Array{}}}),
         [] {
             const Dictionary rules = QVCTXMLRulesTaggingService::defaultRules();
             return 1 + rules.value("DefaultRules")->array()->size();
         },
         1 + QVCTXMLRulesTaggingService::defaultRules().value("DefaultRules")->array()->size()},
        {"DefaultKeywordMapping.plist", "<plist><dict><key>", "DefaultKeywordMapping.plist",
         listOf({{"kick", Dictionary{}}}),
         [] { return QVCTKeywordExtractor::defaultKeywordMapping().size(); },
         QVCTKeywordExtractor::defaultKeywordMapping().size()},
        {"PackDisplayNames.csv", "\xff;no text", "PackDisplayNames.csv", "1;One",
         [] { return packDisplayNames().size(); }, packDisplayNames().size()},
    };
    for (const auto& row : rows) {
        const Resources resources;
        const test::CapturedLog log;
        EXPECT_GT(row.builtIn, 1U) << row.file;
        resources.write(row.file, row.broken);
        for (int time = 0; time < 2; ++time) EXPECT_EQ(row.count(), row.builtIn) << row.file;
        EXPECT_THAT(log.messages(), ElementsAre(AllOf(HasSubstr(row.file), HasSubstr(row.reason),
                                                      HasSubstr("(using the built-in one)"))));
        resources.write(row.file, row.whole);
        EXPECT_EQ(row.count(), 1U) << row.file;
    }
    EXPECT_EQ(packDisplayNames().size(), rows[4].builtIn);
}

TEST(ReplacementFile, ThatIsNotThereIsToldOf) {
    const test::CapturedLog log;
    ResourceBundle::setPathForResource("DefaultKeywordMapping", "plist", "/no/such.plist");
    EXPECT_GT(QVCTKeywordExtractor::defaultKeywordMapping().size(), 1U);
    ResourceBundle::setPathForResource("DefaultKeywordMapping", "plist", std::nullopt);
    EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("/no/such.plist: ")));
}

TEST(ReplacementFile, OfAMappingTableMustBeOne) {
    const std::string header =
        "Type;Legacy Keyword;Legacy Keyword Sub;New Taxonomy Keyword 1;New Taxonomy Keyword 2;"
        "New Taxonomy Keyword 3;New Taxonomy Keyword 4;Comments, Questions";
    const struct {
        std::string table, reason;
    } rows[] = {{header + "\r\nLoopGenres;Jazz;;Jazz;;;;\r\n", ""},
                {header, ""},
                {"Type;\n", "line 1: is not the expected header"},
                {header + "\n\nLoopGenres;Jazz;;Jazz;;;\n", "line 3: does not have 8 fields"}};
    for (const auto& row : rows) {
        const Resources resources;
        const test::CapturedLog log;
        resources.write("LegacyLoopTaxonomyMapping.csv", row.table);
        EXPECT_EQ(TGRTLegacyTaxonomyMapping::defaultLegacyLoopTaxonomyMappingURL().has_value(),
                  row.reason.empty());
        if (row.reason.empty()) {
            EXPECT_THAT(log.messages(), IsEmpty());
        } else {
            EXPECT_THAT(log.messages(), ElementsAre(HasSubstr(row.reason)));
        }
    }
}

}  // namespace
}  // namespace qvct
