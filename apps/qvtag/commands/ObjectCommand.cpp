#include "CommandLine.h"
#include "commands/Commands.h"
#include "formats/QVContentTaggingTypes.h"
#include "formats/TGRTFileNode.h"
#include "indexing/TGRTIndexableContentObject.h"
#include "output/PropertyListOutput.h"
#include "output/RecordOutput.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"

#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    std::vector<std::string> paths;
    LinksOutside links = LinksOutside::files;
    std::uint64_t bits = 0;
};

using ContentObject = QVContentTaggingIndexableContentObject;

/// Like `indexableContentObjectForURL`, but also for audio whose extension is not one of content.
std::shared_ptr<ContentObject> objectOf(const URL& url, std::uint64_t bits, Error* error) {
    const auto taxonomy = TGRTIndexableContentObject::taxonomyForOptions(bits);
    const auto record = TGRTFileNode::nodeWithFileURL(url)->readMetaDataWithOptions(bits, taxonomy, error);
    const bool isKnown = record && record->fileType() != kFileTypeNone;
    if (!isKnown && (bits & kIndexWithoutRecord) == 0) return nullptr;
    return TGRTIndexableContentObject::indexableContentObjectForMetaData(record.get(), url, *taxonomy);
}

Json jsonOfObject(const URL& url, const ContentObject& object) {
    Json json;
    json["path"] = url.path();
    json["displayName"] = object.displayName();
    json["type"] = QVContentTaggingTypes::nameForFileType(object.fileType());
    json["fileType"] = object.fileType();
    json["subFileType"] = object.subFileType();
    json["previewAvailable"] = object.previewAvailable();
    json["packages"] = object.packageIdentifiers();
    json["dependencies"] = Json::array();
    for (const auto& item : object.dependencyItems())
        json["dependencies"].push_back({{"uuid", item->UUID()}, {"path", item->path()}});
    json["taggings"] = Json::array();
    for (const auto& tagging : sortedTaggings(object.taggingDatas()))
        json["taggings"].push_back(jsonOfTagging(*tagging));
    Json keyValues = Json::object();
    const PropertyList values = TGRTKeyValue::keyValueDictionaryForKeyValues(object.valueDatas());
    for (const auto& [key, value] : *values.dictionary())
        append(keyValues, key, value.real() ? jsonOfNumber(*value.real()) : jsonOfPropertyList(value));
    json["keyValues"] = std::move(keyValues);
    return json;
}

void printObject(const URL& url, const ContentObject& object, const Terminal& terminal) {
    print("{}\n", colored(terminal, Color::strong, printable(url.path())));
    printKind(terminal, object.fileType(), object.subFileType());
    printField(terminal, "name", {{printable(object.displayName()), Color::plain}});
    printField(terminal, "preview", {{object.previewAvailable() ? "yes" : "no", Color::plain}});
    std::vector<Word> words;
    for (const std::string& pack : object.packageIdentifiers())
        words.push_back({printable(pack), Color::plain});
    printField(terminal, "packs", words);
    printTaggings(terminal, object.taggingDatas());
    printKeyValues(terminal, object.valueDatas());
    words.clear();
    for (const auto& item : object.dependencyItems())
        words.push_back({printable(item->path()), Color::plain});
    printField(terminal, "needs", words);
}

void run(const Options& options, ToolContext& context) {
    JsonItems json(context.format);
    std::size_t withoutRecord = 0;
    context.forEachContentItem(options.paths, options.links, [&](const URL& url) {
        Error error;
        const auto object = objectOf(url, options.bits, &error);
        if (error.isSet()) {
            context.itemFailed(error);
        } else if (!object) {
            ++withoutRecord;
        }
        if (!object) return;
        if (context.format == Format::table) {
            printObject(url, *object, context.terminal());
        } else {
            json.add(jsonOfObject(url, *object));
        }
    });
    if (context.format != Format::table) json.finish();
    if (withoutRecord > 0) {
        context.note(fmt::format("{} that {} nothing about {} left out; --options 256 shows {} too",
                                 counted(withoutRecord, "item"), withoutRecord == 1 ? "stores" : "store",
                                 withoutRecord == 1 ? "itself is" : "themselves are",
                                 withoutRecord == 1 ? "it" : "them"));
    }
}

}  // namespace

void addObjectCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("object", "Shows what a content database stores of files and bundles");
    command.addOption("paths", options->paths, "Files and folders").required().valueName("PATH");
    command.addFollowFlag(options->links);
    command
        .addOption("--options", options->bits,
                   "Sum of 1: tags of retired vocabularies, and what loop keywords among them are called "
                   "today; 2: what retired tags are called today; 4: tags that the taxonomy does not "
                   "know; 256: items that store nothing")
        .valueName("N")
        .notNegative();
    command.footer("Example:\n  qvtag object --json --options 258 Loops");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
