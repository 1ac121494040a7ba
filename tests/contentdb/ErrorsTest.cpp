#include "Library.h"
#include "autotagging/scripts/ScriptContext.h"
#include "formats/preset/TGRTVorthalPresetMetaDataReader.h"
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"
#include "platform/data/PropertyListFile.h"
#include "platform/data/xml/XmlDocument.h"
#include "platform/data/xml/XmlParsing.h"
#include "platform/files/FileAccess.h"
#include "support/AudioFixtures.h"

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using namespace contentdb;
using Place = std::optional<std::uint64_t>;

/// One of each layer: what knows the path or the place says so, and nobody says it twice.
TEST(Errors, NameEachPlaceOnce) {
    const TemporaryFolder folder;
    std::string attributes;
    for (int i = 0; i <= kMostXmlAttributes; ++i) attributes += " a=\"\"";
    const Wav wav;
    const std::string twoFormats =
        folder.write("two.wav", wav.file(wav.format() + wav.format(1, 8000, 8) + wav.data()));
    const std::string damaged = folder.path("db");
    store(damaged, generatedItems(1, 300));
    const auto bytes = readFile(damaged);
    std::string pages(bytes->begin(), bytes->end());
    pages[pages.size() / 2] ^= 1;
    folder.write("db", pages);
    using Fails = void (*)(const std::string& path, Error* error);
    const Fails readList = [](const auto& path, Error* error) { readDictionaryFile(path, error); };
    const Fails readXml = [](const auto& path, Error* error) { XmlDocument::fromFile(path, error); };
    const Fails readPreset = [](const auto& path, Error* error) {
        TGRTVorthalPresetMetaDataReader::initWithTaxonomy(TGRTTaxonomy::init())
            ->readMetaDataFromURL(URL::fileURLWithPath(path), 0, error);
    };
    const Fails checkScript = [](const auto&, Error* error) { ScriptContext::checkSyntax("1;\n)", error); };
    const Fails writeWav = [](const auto& path, Error* error) {
        const auto data = LCFileParser::fileParserForURL(URL::fileURLWithPath(path))->fileData();
        data->setTaggingDictionary({{"a", 1}});
        LCFileWriter::fileWriterForURL(URL::fileURLWithPath(path))->writeFileData(data, error);
    };
    const Fails replace = [](const auto& path, Error* error) { replaceFile(path, "new", error); };
    const Fails check = [](const auto& path, Error* error) {
        const auto database = ContentDatabase::open(path, error);
        if (database) database->check(error);
    };
    const struct {
        const char* what;
        std::string path;
        Place line, offset;
        Fails fails;
    } rows[] = {
        {"a missing file", folder.path("none"), {}, {}, readList},
        {"a property list", folder.write("a.plist", "<plist><dict>\n<key>"), 2, 19, readList},
        {"XML", folder.write("a.xml", "\n\n<a" + attributes + ">"), 3, {}, readXml},
        {"a preset", folder.write("a.vcp", "fine\n\xff\n"), 2, {}, readPreset},
        {"a script", "", 2, {}, checkScript},
        {"a contradiction in a WAV", twoFormats, {}, 36, writeWav},
        {"a place that cannot be written to", folder.path("none/a.plist"), {}, {}, replace},
        {"a damaged database", damaged, {}, {}, check},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.what);
        Error error;
        row.fails(row.path, &error);
        ASSERT_TRUE(error.isSet());
        EXPECT_EQ(error.path, row.path);
        EXPECT_EQ(error.line, row.line);
        EXPECT_EQ(error.offset, row.offset);
        const std::string message = error.message();
        EXPECT_TRUE(message.starts_with(row.path));
        const bool isTwice = !row.path.empty() && message.find(row.path, 1) != std::string::npos;
        EXPECT_FALSE(isTwice) << message;
        EXPECT_TRUE(message.ends_with(": " + error.reason)) << message;
    }
}

}  // namespace
}  // namespace qvct::test
