#include "FormatsSupport.h"
#include "formats/QVContentEditorFileUtilities.h"
#include "formats/TGRTFileNode.h"
#include "formats/TGRTMetaDataReaderFactory.h"
#include "formats/TGRTMetaDataWriterFactory.h"
#include "formats/audiofile/TGRTAudioFileTypeValidator.h"
#include "formats/bundle/TGRTBundleTypeValidators.h"
#include "formats/library/ContentFolderWalk.h"
#include "formats/library/TGRTPackage.h"
#include "formats/preset/TGRTVorthalPresetTypeValidator.h"
#include "formats/settings/TGRTBinaryFileMetaDataReader.h"
#include "formats/settings/TGRTCstSxvPstTypeValidator.h"
#include "media/loopfile/LCFileWriter.h"
#include "platform/files/EditLock.h"
#include "support/AudioFixtures.h"
#include "support/Corpus.h"

#include <array>
#include <chrono>
#include <filesystem>
#include <functional>
#include <future>
#include <map>
#include <typeindex>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using test::Caf;
using test::Dictionary;
using test::TemporaryFolder;
using test::urlOf;
using test::Wav;
using testing::ElementsAre;

/// The class of what a pointer points to.
template <typename Pointer>
std::type_index classOf(const Pointer& pointer) {
    return pointer ? std::type_index(typeid(*pointer)) : std::type_index(typeid(nullptr));
}

template <typename Class>
std::type_index is() {
    return typeid(Class);
}

std::string plainWav() {
    const Wav wav;
    return wav.file(wav.format() + wav.data());
}

std::string loopWav() {
    const Wav wav;
    return wav.file(wav.acid(0, 60, 4, 120) + wav.format() + wav.data());
}

TEST(ReaderFactory, GoesByTheExtensionAlone) {
    const struct {
        std::type_index reader;
        std::vector<const char*> paths;
    } cases[] = {
        {is<TGRTTavioLoopMetaDataReader>(), {"KICK.WAV", "a.aif", "a.AIFF", "a.caf", "a.loopdata"}},
        {is<TGRTPatchMetaDataReader>(), {"a.Patch"}},
        {is<TGRTOstraProjectMetaDataReader>(), {"a.ostrax"}},
        {is<TGRTVorthalPresetMetaDataReader>(), {"a.vcp"}},
        {is<TGRTCstSxvPstMetaDataReader>(), {"a.cst", "a.sxv", "a.pst", "a.aaz"}},
        {is<TGRTBinaryFileMetaDataReader>(), {"a.data"}},
        {is<std::nullptr_t>(), {"a.txt", "wav"}},
    };
    for (const auto& [reader, paths] : cases) {
        for (const std::string path : paths)
            EXPECT_EQ(classOf(TGRTMetaDataReaderFactory::metaDataReaderForURL(urlOf("/none/" + path))),
                      reader)
                << path;
    }
    EXPECT_FALSE(TGRTBundleMetaDataReader::supportsFileExtension("patch"));
    EXPECT_FALSE(TGRTAudioFileMetaDataReader::supportsFileExtension("loopdata"));
}

TEST(BaseReader, FillsNothingButTheUUID) {
    const auto reader = TGRTMetaDataReaderFactory::metaDataReaderForURL(urlOf("/no/such.wav"));
    std::string uuid = "mine";
    std::int64_t fileType = 99;
    auto taggings = test::taggingsOf({{"Genres", "House"}});
    ObjectSet<TGRTKeyValue> keyValues = {TGRTKeyValue::initWithKeyStringValue("a", "b")};
    EXPECT_FALSE(reader->readUUID(&uuid, &fileType, &taggings, &keyValues, 0, urlOf("/no/such.wav")));
    EXPECT_EQ(uuid, "mine");
    EXPECT_EQ(fileType, kFileTypeNone);
    EXPECT_TRUE(taggings.empty() && keyValues.empty());
    EXPECT_FALSE(reader->readUUID(nullptr, nullptr, nullptr, nullptr, 0, urlOf("/no/such.wav")));
}

/// Every kind of item that there is, and things that only look like one.
struct Items {
    TemporaryFolder folder;

    Items() {
        folder.write("plain.wav", plainWav());
        folder.write("loop.wav", loopWav());
        folder.write("named.any", plainWav());
        test::writeList(folder, "record.loopdata", {{"Type", 1}});
        folder.write("broken.wav", "RIFF");
        folder.write("Bass.cst", "");
        folder.write("Bass.cst.caf", Caf::file(Caf::description() + Caf::data()));
        folder.write("Sampler.sxv", "");
        folder.write("Echo.PST", "");
        folder.write("Strip.aaz", "");
        folder.write("Lead.vcp", "");
        folder.write("Pad.patch/prelisten.caf", Caf::file(Caf::description() + Caf::data()));
        folder.write("Pad.patch/inside.pst", "");
        folder.write("Pad.patch/deep/inside.pst", "");
        folder.write("Dry.patch/x", "");
        folder.write("Song.ostrax/x", "");
        folder.write("file.patch", "");
        folder.write("file.ostrax", "");
        folder.write("folder.vcp/x", "");
        folder.write("folder.cst/x", "");
        folder.write("words.txt", "words");
    }
};

TEST(FileNode, FindsTheValidatorWithItsActionsReaderAndWriters) {
    const Items items;
    struct Kind {
        std::type_index validator, reader, taggingWriter, metaDataWriter;
    };
    const auto noType = is<std::nullptr_t>();
    const Kind none{noType, noType, noType, noType};
    const Kind audio{is<TGRTAudioFileTypeValidator>(), is<TGRTAudioFileMetaDataReader>(),
                     is<TGRTAudioFileTaggingWriter>(), is<TGRTAudioFileMetaDataWriter>()};
    const Kind loop{is<TGRTTavioLoopTypeValidator>(), is<TGRTTavioLoopMetaDataReader>(),
                    is<TGRTTavioLoopTaggingWriter>(), is<TGRTTavioLoopMetaDataWriter>()};
    const Kind settings{is<TGRTCstSxvPstTypeValidator>(), is<TGRTCstSxvPstMetaDataReader>(),
                        is<TGRTCstSxvPstTaggingWriter>(), is<TGRTCstSxvPstMetaDataWriter>()};
    const Kind preset{is<TGRTVorthalPresetTypeValidator>(), is<TGRTVorthalPresetMetaDataReader>(),
                      is<TGRTVorthalPresetMetaDataWriter>(), is<TGRTVorthalPresetMetaDataWriter>()};
    const Kind patch{is<TGRTPatchTypeValidator>(), is<TGRTPatchMetaDataReader>(),
                     is<TGRTPatchTaggingWriter>(), is<TGRTPatchMetaDataWriter>()};
    const Kind project{is<TGRTOstraProjectTypeValidator>(), is<TGRTOstraProjectMetaDataReader>(),
                       is<TGRTOstraProjectTaggingWriter>(), is<TGRTOstraProjectMetaDataWriter>()};
    const struct {
        const char* name;
        const Kind& kind;
        unsigned actions;
        const char* preview;
    } cases[] = {
        {"plain.wav", audio, 12, "plain.wav"},
        {"loop.wav", loop, 12, "loop.wav"},
        {"named.any", audio, 12, "named.any"},
        {"record.loopdata", loop, 12, "record.loopdata"},
        {"Bass.cst", settings, 1, ""},
        {"Sampler.sxv", settings, 3, ""},
        {"Echo.PST", settings, 3, ""},
        {"Strip.aaz", settings, 0, ""},
        {"Lead.vcp", preset, 2, ""},
        {"Pad.patch", patch, 5, "Pad.patch/prelisten.caf"},
        {"Dry.patch", patch, 1, ""},
        {"Song.ostrax", project, 0, ""},
        {"Pad.patch/deep/inside.pst", settings, 3, ""},
        // What lies in a patch, previews, and what is not what its name says.
        {"Pad.patch/inside.pst", none, 0, ""},
        {"Pad.patch/prelisten.caf", none, 0, ""},
        {"Bass.cst.caf", none, 0, ""},
        {"file.patch", none, 0, ""},
        {"file.ostrax", none, 0, ""},
        {"folder.vcp", none, 0, ""},
        {"folder.cst", none, 0, ""},
        {"broken.wav", none, 0, ""},
        {"words.txt", none, 0, ""},
        {"absent.wav", none, 0, ""},
    };
    for (const auto& c : cases) {
        const URL url = urlOf(items.folder.path(c.name));
        const auto node = TGRTFileNode::nodeWithFileURL(url);
        EXPECT_EQ(classOf(node->validator()), c.kind.validator) << c.name;
        EXPECT_EQ(node->itemActions(), c.actions) << c.name;
        const auto preview = node->prelistenURL();
        EXPECT_EQ(preview ? preview->path() : "", *c.preview ? items.folder.path(c.preview) : "") << c.name;
        EXPECT_EQ(classOf(node->metaDataReaderForFileURL(url)), c.kind.reader) << c.name;
        EXPECT_EQ(classOf(TGRTMetaDataWriterFactory::taggingWriterForURL(url)), c.kind.taggingWriter)
            << c.name;
        EXPECT_EQ(classOf(TGRTMetaDataWriterFactory::metaDataWriterForURL(url)), c.kind.metaDataWriter)
            << c.name;
        EXPECT_EQ(TGRTMetaDataWriterFactory::contentInfoWriterForURL(url) == nullptr, c.kind.reader == noType)
            << c.name;
    }
}

TEST(FileNode, ActionsOfTwoValidatorsDoNotLookAtTheURL) {
    const URL absent = urlOf("/no/such.txt");
    EXPECT_EQ(TGRTAudioFileTypeValidator().itemActionsForFileURL(absent), 12U);
    EXPECT_EQ(TGRTVorthalPresetTypeValidator().itemActionsForFileURL(absent), 2U);
    EXPECT_EQ(TGRTCstSxvPstTypeValidator().itemActionsForFileURL(urlOf("/no/such.pst")), 0U);
    const URL remote = URL::URLWithString("http://host/tmp");
    EXPECT_EQ(TGRTFileNode::validatorForFileURL(remote), nullptr);
}

TEST(FileNode, ReadsAudioOfAnyNameAndNamesWhatIsNoContent) {
    const Items items;
    const auto read = [&](const char* name, Error* error) {
        return TGRTFileNode::nodeWithFileURL(urlOf(items.folder.path(name)))
            ->readMetaDataWithOptions(0, error);
    };
    Error error;
    ASSERT_NE(read("named.any", &error), nullptr);
    EXPECT_EQ(read("named.any", &error)->fileType(), kFileTypeAudioFile);
    EXPECT_EQ(read("Bass.cst", &error), nullptr);
    EXPECT_EQ(error.message(), "") << "an item that stores nothing is not broken";
    EXPECT_EQ(read("words.txt", &error), nullptr);
    EXPECT_THAT(error.message(), testing::EndsWith("words.txt: no kind of content"));
}

TEST(PrelistenFiles, AreToldByTheEndOfThePath) {
    struct {
        const char* path;
        bool isPreview;
    } const cases[] = {
        {"/a/Bass.cst.caf", true},
        {"/a/BASS.CST.CAF", true},
        {"/a/x.vcp.caf", true},
        {"/a/x.pst.caf", true},
        {"/a/x.sxv.caf", true},
        {"/a/Pad.patch/prelisten.caf", true},
        {"/a/Pad.PATCH/Prelisten.caf", true},
        {"/a/.cst.caf", true},
        {"/a/x.aaz.caf", false},
        {"/a/x.patch.caf", false},
        {"/a/x.cst.wav", false},
        {"/a/prelisten.caf", false},
        {"/a/Pad.patch/other.caf", false},
        {"/a/Pad.patch/prelisten.aif", false},
        {"/a/cst.caf", false},
    };
    for (const auto& c : cases)
        EXPECT_EQ(TGRTAudioFileTypeValidator::isPrelistenFile(urlOf(c.path)), c.isPreview) << c.path;
}

/// The names of the candidates in order; each is found once those before it are gone.
void expectInOrder(const TemporaryFolder& folder, const std::vector<std::string>& candidates,
                   const std::function<std::optional<URL>()>& lookUp) {
    for (const std::string& name : candidates) folder.write(name, "");
    for (const std::string& name : candidates) {
        const auto found = lookUp();
        ASSERT_TRUE(found) << name;
        EXPECT_EQ(found->path(), folder.path(name));
        std::filesystem::remove(found->path());
    }
    EXPECT_EQ(lookUp(), std::nullopt);
}

TEST(FolderWalk, GoesOnWhereNobodyHearsOfWhatCannotBeRead) {
    const TemporaryFolder folder;
    folder.write("b/Kick.wav", "");
    std::filesystem::create_symlink("nowhere", folder.path("a.wav"));
    std::vector<std::size_t> items;
    const auto count = [&items](const ContentFolder& found) {
        items.push_back(found.items.size());
        return true;
    };
    EXPECT_TRUE(walkContentFolders(folder.path(), count, nullptr));
    EXPECT_THAT(items, ElementsAre(0U, 1U));
}

TEST(FileUtilities, LookForCompanionsInTheirOrder) {
    const TemporaryFolder folder;
    const URL bundle = urlOf(folder.path("Pad.patch"));
    expectInOrder(folder,
                  {"Pad.patch/org.qvcontenttagging.intermediate.cache.zxml",
                   "Pad.patch/org.qvcontenttagging.intermediate.cache.xml",
                   "Pad.patch/#Root.cst.intermediate.cache.xml", "Pad.patch.zxml", "Pad.patch.xml"},
                  [&] { return QVContentEditorFileUtilities::intermediateCacheURLForURL(bundle); });
    expectInOrder(folder, {"Pad.patch/prelisten.caf", "Pad.patch.caf"},
                  [&] { return QVContentEditorFileUtilities::prelistenURLForURL(bundle); });
    const URL sound = urlOf(folder.path("Kick.AIFF"));
    expectInOrder(folder, {"Kick.AIFF", "Kick.AIFF.caf"},
                  [&] { return QVContentEditorFileUtilities::prelistenURLForURL(sound); });
    for (const char* own : {"/no/such.XML", "/no/such.zxml"})
        EXPECT_EQ(QVContentEditorFileUtilities::intermediateCacheURLForURL(urlOf(own)), urlOf(own));
    EXPECT_EQ(QVContentEditorFileUtilities::intermediateCacheURLForURL(std::nullopt), std::nullopt);
    EXPECT_EQ(QVContentEditorFileUtilities::prelistenURLForURL(std::nullopt), std::nullopt);
}

TEST(ReadersAndWriters, TakeNoOtherURLForAPathOfThisMachine) {
    const TemporaryFolder folder;
    folder.write("a.wav", loopWav());
    test::writeList(folder, "a.patch/tags.plist", {{"Type", 1}});
    test::writeList(folder, "a.ostrax/Resources/tags.plist", {{"Type", 8}});
    folder.write("a.cst", "x");
    test::writeList(folder, "a.cst.plist", {{"Type", 6}});
    folder.write("a.vcp", "<tagging>\n</tagging>\n");
    for (const char* name : {"a.wav", "a.patch", "a.ostrax", "a.cst", "a.vcp"}) {
        const URL local = urlOf(folder.path(name));
        const URL remote = URL::URLWithString("http://host" + local.path());
        Error error;
        const auto reader = TGRTMetaDataReaderFactory::metaDataReaderForURL(local);
        EXPECT_NE(reader->readMetaDataFromURL(local, 0), nullptr) << name;
        EXPECT_EQ(reader->readMetaDataFromURL(remote, 0, &error), nullptr) << name;
        EXPECT_THAT(error.message(), testing::StartsWith("http://host/")) << name;
        error = {};
        const auto writer = TGRTMetaDataWriterFactory::taggingWriterForURL(local);
        EXPECT_FALSE(writer->writeTaggings(test::taggingsOf({{"Genres", "House"}}), remote, &error)) << name;
        EXPECT_THAT(error.message(), testing::StartsWith("http://host/")) << name;
        EXPECT_TRUE(reader->readMetaDataFromURL(local, 0)->taggings().empty()) << name;
    }
    const URL remote = URL::URLWithString("http://host" + folder.path("taxonomy.plist"));
    Error error;
    EXPECT_FALSE(TGRTTaxonomy::defaultTaxonomy()->writeToURL(remote, &error));
    EXPECT_EQ(error.message(), remote.absoluteString() + ": is no file URL");
    EXPECT_FALSE(std::filesystem::exists(folder.path("taxonomy.plist")));
    error = {};
    TGRTTaxonomy::taxonomyWithContentsOfURL(remote, &error);
    EXPECT_EQ(error.message(), remote.absoluteString() + ": is no file URL");
}

/// An item for each kind of writer, in a folder that the test has its turn in.
class WritersInTurn : public testing::Test {
  protected:
    WritersInTurn() {
        test::writeList(folder_, "a.patch/tags.plist", {{"Type", 1}});
        folder_.write("a.cst", "x");
        folder_.write("a.vcp", "<tagging>\n</tagging>\n");
        folder_.write("chunks.wav", loopWav());
    }

    std::string write(const char* name, const char* genre) const {
        const URL url = urlOf(folder_.path(name));
        Error error;
        TGRTMetaDataWriterFactory::taggingWriterForURL(url)->writeTaggings(
            test::taggingsOf({{"Genres", genre}}), url, &error);
        return error.message();
    }

    /// Each writer writes in a thread of its own, and says why it could not.
    std::vector<std::future<std::string>> writeAll() const {
        std::vector<std::future<std::string>> reasons;
        for (const char* name : kNames)
            reasons.push_back(std::async(std::launch::async, [this, name] { return write(name, "House"); }));
        reasons.push_back(std::async(std::launch::async, [url = urlOf(folder_.path("chunks.wav"))] {
            Error error;
            LCFileWriter::fileWriterForURL(url)->writeFileData(std::make_shared<LCFileData>(), &error);
            return error.message();
        }));
        return reasons;
    }

    std::map<std::string, std::string> files() const {
        std::map<std::string, std::string> contents;
        for (const std::string& path : test::filesBelow(folder_.path())) contents[path] = test::readAll(path);
        return contents;
    }

    static constexpr std::array kNames = {"a.wav", "a.patch", "a.cst", "a.vcp"};
    TemporaryFolder folder_;
    std::unique_ptr<EditLock> turn_ = EditLock::acquire(folder_.write("a.wav", loopWav()));
};

TEST_F(WritersInTurn, WaitBeforeTheyReadWhatTheyChange) {
    auto reasons = writeAll();
    for (auto& reason : reasons)
        EXPECT_EQ(reason.wait_for(std::chrono::milliseconds(100)), std::future_status::timeout);
    for (const char* name : kNames) EXPECT_EQ(write(name, "Techno"), "");
    turn_.reset();
    for (auto& reason : reasons) EXPECT_EQ(reason.get(), "");
}

TEST_F(WritersInTurn, LeaveAloneWhatAnotherWriterDoesNotLetGo) {
    const auto before = files();
    for (auto& reason : writeAll()) EXPECT_THAT(reason.get(), testing::HasSubstr("waited 30 s for a turn"));
    EXPECT_EQ(files(), before);
}

TEST(FileNode, IsKnownByItsURLAndAPackByItsIdentifier) {
    const auto node = TGRTFileNode::nodeWithFileURL(urlOf("/a.wav"));
    const auto pack = TGRTPackage::packageWithIdentifier("a");
    EXPECT_TRUE(node->isEqual(*TGRTFileNode::nodeWithFileURL(urlOf("/a.wav"))));
    EXPECT_FALSE(node->isEqual(*TGRTFileNode::nodeWithFileURL(urlOf("/b.wav"))));
    EXPECT_FALSE(node->isEqual(*pack));
    EXPECT_TRUE(pack->isEqual(*TGRTPackage::packageWithIdentifier("a")));
    EXPECT_FALSE(pack->isEqual(*TGRTPackage::packageWithIdentifier("b")));
    EXPECT_FALSE(pack->isEqual(*node));
}

TEST(Packages, GatherTheItemsThatNameThem) {
    const TemporaryFolder folder;
    std::vector<URL> items;
    for (const auto& [name, pack] :
         {std::pair{"a.cst", "0002_analogpulse"}, {"b.cst", "home made"}, {"c.cst", "0002_analogpulse"}}) {
        test::writeList(folder, std::string(name) + ".plist",
                        {{"Tagging", test::taggingDictionary("Soundpack", pack)}});
        items.push_back(urlOf(folder.path(name)));
    }
    items.push_back(urlOf(folder.path("absent.cst")));
    const auto packages = TGRTPackage::packagesForItems(items);
    ASSERT_EQ(packages.size(), 2U);
    EXPECT_EQ(packages[0]->displayName(), "Analog Pulse");
    EXPECT_THAT(packages[0]->items(), ElementsAre(items[0], items[2]));
    EXPECT_EQ(packages[1]->displayName(), "home made");
}

}  // namespace
}  // namespace qvct
