#include "demo/Library.h"
#include "demo/Patches.h"
#include "platform/data/PropertyListFile.h"
#include "support/Places.h"
#include "support/TemporaryFolder.h"

#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <libxml/parser.h>
#include <libxml/xpath.h>
#include <zlib.h>
#include <zstd.h>

namespace qvct::demo {
namespace {

using test::TemporaryFolder;
using Document = std::unique_ptr<xmlDoc, decltype(&xmlFreeDoc)>;

std::string inflated(const std::string& bytes) {
    z_stream stream{};
    inflateInit2(&stream, MAX_WBITS + 32);  // zlib and gzip alike
    std::string text(1 << 20, '\0');
    stream.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(bytes.data()));
    stream.avail_in = static_cast<uInt>(bytes.size());
    stream.next_out = reinterpret_cast<Bytef*>(text.data());
    stream.avail_out = static_cast<uInt>(text.size());
    EXPECT_EQ(inflate(&stream, Z_FINISH), Z_STREAM_END);
    EXPECT_EQ(stream.avail_in, 0U) << "bytes after the end of the stream";
    text.resize(stream.total_out);
    inflateEnd(&stream);
    return text;
}

std::string decompressed(const std::string& bytes, Compression compression) {
    if (compression == Compression::none) return bytes;
    if (compression != Compression::zstandard) return inflated(bytes);
    std::string text(1 << 20, '\0');
    text.resize(ZSTD_decompress(text.data(), text.size(), bytes.data(), bytes.size()));
    return text;
}

/// Strict: a fault in the document is a fault in the test.
Document parsed(const std::string& text) {
    return {xmlReadMemory(text.data(), static_cast<int>(text.size()), nullptr, nullptr, XML_PARSE_NONET),
            &xmlFreeDoc};
}

int matches(const Document& document, const std::string& expression) {
    xmlXPathContext* context = xmlXPathNewContext(document.get());
    xmlXPathObject* result =
        xmlXPathEvalExpression(reinterpret_cast<const xmlChar*>(expression.c_str()), context);
    const int count = result != nullptr && result->nodesetval != nullptr ? result->nodesetval->nodeNr : 0;
    xmlXPathFreeObject(result);
    xmlXPathFreeContext(context);
    return count;
}

/// Whether any patch of the library has what the expression looks for.
bool anyPatchMatches(const std::string& expression) {
    for (const PatchItem& item : patches()) {
        if (matches(parsed(xml({"", item.channels})), expression) > 0) return true;
    }
    return false;
}

std::string fileBytes(const std::string& path) {
    std::ifstream stream(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(stream), {}};
}

TEST(DemoPatches, CachesOnDiskParseWhateverTheirCompression) {
    const TemporaryFolder folder;
    writeLibrary(folder.path());
    std::vector<PatchItem> items = patches();
    items.insert(items.end(), settingsWithCaches().begin(), settingsWithCaches().end());
    for (const PatchItem& item : items) {
        SCOPED_TRACE(item.path);
        const std::string base =
            folder.path(item.path) +
            (item.path.ends_with(".patch") ? "/org.qvcontenttagging.intermediate.cache" : "");
        const bool plain = item.compression == Compression::none;
        const Document document =
            parsed(decompressed(fileBytes(base + (plain ? ".xml" : ".zxml")), item.compression));
        ASSERT_TRUE(document);
        EXPECT_EQ(matches(document, "/Patch/Channels/Channel"), static_cast<int>(item.channels.size()));
    }
}

TEST(DemoPatches, MeetEveryXPathRule) {
    const auto file = readDictionaryFile(QVCT_SOURCE "/src/resources/data/DefaultRules.plist");
    ASSERT_TRUE(file);
    int rules = 0;
    for (const PropertyList& rule : *file->value("DefaultRules")->array()) {
        if (*rule.dictionary()->value("type")->string() != "XPath") continue;
        ++rules;
        const std::string& expression = *rule.dictionary()->value("rule")->string();
        EXPECT_TRUE(anyPatchMatches(expression)) << expression;
    }
    EXPECT_EQ(rules, 17);
}

TEST(DemoPatches, HoldWhatTheScriptsLookFor) {
    const std::string active = "/Patch/Channels/Channel/Plugins/Plugin[@bypassed=0 and @name='";
    for (const std::string& expression : {
             std::string(
                 "//Plugin[@name='Amp']/Parameters[Parameter[@name='Amp'] and Parameter[@name='Speaker']]"),
             std::string("//Plugin[@name='Bass Amp']/Parameters[Parameter[@name='Amp']]"),
             active + "Arpeggiator']/Parameters/Parameter[@name='Swing' and @valueString>50]",
             active + "Beatforge']/Parameters/Parameter[@name='Swing Amnt Pat  1' and @valueString>50]",
             active + "Arpeggiator']/Parameters/Parameter[@name='Rate' and contains(@valueString,'triplet')]",
             active + "Tape Delay']/Parameters[Parameter[@name='Sync To Tempo' and @value>=1] and "
                      "Parameter[@name='Note' and contains(@valueString,'triplet')]]",
             active + "Echo']/Parameters/Parameter[@name='Time' and contains(@valueString,'triplet')]",
         }) {
        EXPECT_TRUE(anyPatchMatches(expression)) << expression;
    }
}

TEST(DemoPatches, ScriptsFindMoreThanOneParameterInEachPlugin) {
    // A single child becomes an object instead of an array, in which the scripts find nothing.
    EXPECT_FALSE(anyPatchMatches("//Parameters[count(Parameter)=1]"));
}

TEST(DemoPatches, AttributesKeepMarkupCharacters) {
    const Document document =
        parsed(xml({"<&>\"é", {{"Channel", "Audio", "Mono", {{"A&B", "\"<x>\"", {}}}}}}));
    ASSERT_TRUE(document);
    EXPECT_EQ(matches(document, "/Patch[@name='<&>\"é']//Plugin[@name='A&B' and @settingName='\"<x>\"']"), 1);
}

}  // namespace
}  // namespace qvct::demo
