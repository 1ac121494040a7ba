#include "metadata/QVCTUUIDGenerator.h"
#include "metadata/TGRTContentInfo.h"
#include "metadata/TGRTSettingsInfo.h"
#include "taxonomy/TaggingTypes.h"

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using Array = PropertyList::Array;
using Dictionary = PropertyList::Dictionary;

std::shared_ptr<TGRTContentInfo> infoOf(const PropertyList& list) {
    return TGRTContentInfo::initWithDictionary(&list);
}

TEST(UUIDGenerator, MakesTheNameBasedIdentifierOfTheNormalisedPath) {
    const auto identifier = QVCTUUIDGenerator::automaticUUIDForAbsolutePath;
    // As other makers of version 5 identifiers have it, from our namespace and the path.
    EXPECT_EQ(identifier("/Library/Sounds/Kick.wav"), "1e5e586b-a4ac-5dda-a754-97a52fa6056b");
    EXPECT_EQ(identifier("/\xc3\x9c/a b"), "4b39e47f-0255-5a5d-8290-b88cb35f845f");
    EXPECT_EQ(identifier("/"), "bd9e4730-fcd0-563b-87ca-627da806ac2c");
    for (const char* same : {"/Library//Sounds/./Kick.wav", "/Library/x/../Sounds/Kick.wav/",
                             "Library/Sounds/Kick.wav", "/../Library/Sounds/Kick.wav"}) {
        EXPECT_EQ(identifier(same), identifier("/Library/Sounds/Kick.wav")) << same;
    }
    EXPECT_EQ(identifier(""), identifier("/"));
    EXPECT_NE(identifier("/library/Sounds/Kick.wav"), identifier("/Library/Sounds/Kick.wav"));
}

TEST(ContentInfo, HoldsEachPathOnceAndWritesThemSorted) {
    const auto info =
        infoOf(Dictionary{{"Dependencies", Array{"/b.wav", "/a.wav", "/b.wav", "/x/../b.wav", 7}}});
    EXPECT_THAT(info->assetDependencyPaths(), ElementsAre("/a.wav", "/b.wav"));
    EXPECT_EQ(info->assetDependencyIdentifiers().size(), 2U);
    EXPECT_EQ(PropertyList(info->dictionary()),
              PropertyList(Dictionary{{"Dependencies", Array{"/a.wav", "/b.wav"}}}));
    info->updateDependencyPaths({"/c.wav", "/a.wav"});
    EXPECT_THAT(info->assetDependencyPaths(), ElementsAre("/a.wav", "/b.wav", "/c.wav"));
    info->resetDependencyPaths();
    EXPECT_TRUE(info->dictionary().empty());
}

TEST(ContentInfo, KeepsApplicationsThatHaveAnIdentifier) {
    const Dictionary plain{{"AppIdentifier", "com.example.host"}};
    const Dictionary full{
        {"AppIdentifier", "com.example.host"}, {"MinimumVersion", "10.7"}, {"Legacy", true}};
    const auto info = infoOf(
        Dictionary{{"ApplicationInfos",
                    Array{plain, full, full, Dictionary{{"MinimumVersion", "1"}},
                          Dictionary{{"AppIdentifier", 5}}, Dictionary{{"AppIdentifier", ""}}, "text",
                          Dictionary{{"AppIdentifier", "other"}, {"MinimumVersion", ""}, {"Legacy", 0}}}}});
    // The one with an empty identifier is held, but not written.
    EXPECT_EQ(info->applicationInfos().size(), 4U);
    EXPECT_EQ(PropertyList(info->dictionary()),
              PropertyList(Dictionary{
                  {"ApplicationInfos", Array{plain, full, Dictionary{{"AppIdentifier", "other"}}}}}));
    info->setupApplicationInfosFromArray({});
    EXPECT_TRUE(info->dictionary().empty());
}

TEST(ContentInfo, PassesOverWhatIsNotOfItsType) {
    EXPECT_TRUE(
        infoOf(Dictionary{{"Dependencies", "/a"}, {"ApplicationInfos", Dictionary{}}})->dictionary().empty());
    EXPECT_TRUE(infoOf("text")->dictionary().empty());
    EXPECT_TRUE(TGRTContentInfo::initWithDictionary(nullptr)->dictionary().empty());
}

TEST(DependencyItem, IsKnownByItsIdentifierAndNothingWithoutPath) {
    const auto a = TGRTDependencyItem::dependencyItemWithPath("/a");
    const auto b = TGRTDependencyItem::dependencyItemWithPath("/b");
    EXPECT_TRUE(a->isEqual(*TGRTDependencyItem::dependencyItemWithPath("/x/../a")));
    EXPECT_FALSE(a->isEqual(*b));
    b->setUUID(a->UUID());
    EXPECT_TRUE(a->isEqual(*b));
    EXPECT_NE(a->hash(), b->hash());
    a->setPath("");
    EXPECT_FALSE(a->isEqual(*a));
    EXPECT_TRUE(b->isEqual(*a));
}

TEST(ApplicationInfo, EqualityFollowsItsFields) {
    const auto a = TGRTApplicationInfo::init();
    const auto b = TGRTApplicationInfo::init();
    EXPECT_EQ(a->dictionary(), std::nullopt);
    a->setAppIdentifier("host");
    EXPECT_FALSE(a->isEqual(*b));
    b->setAppIdentifier("host");
    EXPECT_TRUE(a->isEqual(*b));
    b->setLegacy(true);
    EXPECT_FALSE(a->isEqual(*b));
}

TEST(Descriptions, NameTheClassTheAddressAndTheFields) {
    const auto item = TGRTDependencyItem::dependencyItemWithPath("/a");
    EXPECT_THAT(item->description(),
                testing::MatchesRegex("<TGRTDependencyItem 0x[0-9a-f]+> UUID: [0-9a-f-]+ path: /a"));
    const auto app = TGRTApplicationInfo::init();
    EXPECT_THAT(app->description(),
                testing::MatchesRegex("<TGRTApplicationInfo 0x[0-9a-f]+> appIdentifier: \\(null\\) "
                                      "minimumVersion: \\(null\\) legacy: 0"));
    const auto info = infoOf(Dictionary{{"Dependencies", Array{"/a", "/b"}}});
    EXPECT_THAT(info->description(),
                testing::MatchesRegex("<TGRTContentInfo 0x[0-9a-f]+> assetDependencyItems: "
                                      "\\{<.* path: /a, <.* path: /b\\} applicationInfos: \\{\\}"));
    TGRTSettingsInfo settings;
    settings.setPlugInSubID(1);
    settings.setManuID(2);
    settings.setProductID(3);
    settings.setPlugInID(4);
    EXPECT_THAT(settings.description(),
                testing::MatchesRegex(
                    "<TGRTSettingsInfo 0x[0-9a-f]+> plugInSubID: 1 manuID: 2 productID: 3 plugInID: 4"));
}

}  // namespace
}  // namespace qvct
