#include "FormatsSupport.h"
#include "formats/library/ContentWalk.h"
#include "formats/library/FolderRejections.h"
#include "support/CapturedLog.h"

#include <filesystem>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using test::Dictionary;
using test::TemporaryFolder;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using Array = PropertyList::Array;
using Labels = std::set<std::string>;

const std::string kName(kFolderRecordName);

TEST(FolderRejections, AreKeptBesideWhatElseIsSaidOfAFolder) {
    const TemporaryFolder folder;
    Error error;
    EXPECT_EQ(rejectedLabelsOfFolder(folder.path(), &error), Labels{});
    EXPECT_FALSE(error.isSet());
    for (const auto format : {PropertyListFormat::xml, PropertyListFormat::binary}) {
        test::writeList(folder, kName, {{"Mine", 7}}, format);
        ASSERT_TRUE(setRejectedLabelsOfFolder({"Snare", "Kick"}, folder.path(), &error)) << error.message();
        EXPECT_EQ(rejectedLabelsOfFolder(folder.path()), (Labels{"Kick", "Snare"}));
        ASSERT_TRUE(setRejectedLabelsOfFolder({}, folder.path()));
        EXPECT_EQ(readDictionaryFile(folder.path(kName)), (Dictionary{{"Mine", 7}}));
    }
    ASSERT_TRUE(setRejectedLabelsOfFolder({"Kick"}, folder.path(), nullptr, {.isDryRun = true}));
    EXPECT_EQ(rejectedLabelsOfFolder(folder.path()), Labels{});
    bool isItem = false;
    walkContent(
        folder.path(), [&isItem](const URL&) { return isItem = true; }, nullptr);
    EXPECT_FALSE(isItem);
}

TEST(FolderRejections, OfABrokenFileAreToldOnceIgnoredAndNeverWrittenOver) {
    const struct {
        std::string bytes;
        const char* reason;
    } cases[] = {
        {"<plist><dict>", "XML property list"},
        {serializePropertyList(Array{"Kick"}, PropertyListFormat::binary), "is no dictionary"},
        {serializePropertyList(Dictionary{{"Rejected", "Kick"}}, PropertyListFormat::xml),
         "\"Rejected\" is no array of labels"},
        {"{ Rejected = (Kick); }" + std::string(2'000'000, ' '), "over the limit"},
    };
    for (const auto& c : cases) {
        const TemporaryFolder folder;
        const std::string path = folder.write(kName, c.bytes);
        const test::CapturedLog log;
        FolderRejections rejections;
        EXPECT_EQ(rejections.ofFolder(folder.path()), nullptr);
        EXPECT_EQ(rejections.ofFolder(folder.path()), nullptr);
        EXPECT_THAT(log.messages(), ElementsAre(testing::AllOf(testing::StartsWith(path + ": "),
                                                               HasSubstr(c.reason), HasSubstr("not count"))));
        Error error;
        EXPECT_FALSE(setRejectedLabelsOfFolder({"Snare"}, folder.path(), &error)) << c.reason;
        EXPECT_EQ(test::readAll(path), c.bytes) << c.reason;
    }
    const TemporaryFolder folder;
    std::filesystem::create_directory(folder.path(kName));
    const test::CapturedLog log;
    EXPECT_EQ(FolderRejections().ofFolder(folder.path()), nullptr);
    EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("is a folder")));
}

TEST(FolderRejections, AreLookedAtOnce) {
    const TemporaryFolder folder;
    FolderRejections rejections;
    EXPECT_EQ(rejections.ofFolder(folder.path()), nullptr);
    test::writeList(folder, kName, {{"Rejected", Array{"Kick"}}});
    EXPECT_EQ(rejections.ofFolder(folder.path()), nullptr);
    FolderRejections later;
    ASSERT_NE(later.ofFolder(folder.path()), nullptr);
    EXPECT_EQ(*later.ofFolder(folder.path()), Labels{"Kick"});
}

}  // namespace
}  // namespace qvct
