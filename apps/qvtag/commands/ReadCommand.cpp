#include "CommandLine.h"
#include "commands/Commands.h"
#include "formats/QVContentTaggingTypes.h"
#include "formats/TGRTFileNode.h"
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
    bool legacy = false;
    bool mapped = false;
};

/// The record of an item; an empty one of its kind when it stores none, null when it cannot be read.
std::shared_ptr<TGRTMetaData> readRecord(const URL& url, std::uint64_t bits, ToolContext& context) {
    Error error;
    auto record = TGRTFileNode::nodeWithFileURL(url)->readMetaDataWithOptions(bits, &error);
    if (error.isSet()) {
        context.itemFailed(error);
        return nullptr;
    }
    if (record) return record;
    record = TGRTMetaData::init();
    record->setFileType(QVContentTaggingTypes::fallBackFileTypeForURL(url));
    return record;
}

Json jsonOfRecord(const URL& url, const TGRTMetaData& record) {
    Json json;
    json["path"] = url.path();
    const std::string name = record.displayName().value_or("");
    json["displayName"] = name.empty() ? Json() : Json(name);
    json["fileType"] = record.fileType();
    json["subFileType"] = record.subFileType();
    json["taggings"] = Json::array();
    for (const auto& tagging : sortedTaggings(record.taggings()))
        json["taggings"].push_back(jsonOfTagging(*tagging));
    json["rejected"] = record.rejectedLabels();
    json["keyValues"] = jsonOfPropertyList(TGRTKeyValue::keyValueDictionaryForKeyValues(record.keyValues()));
    json["contentInfo"] =
        record.contentInfo() ? jsonOfPropertyList(record.contentInfo()->dictionary()) : Json::object();
    return json;
}

void printRecord(const URL& url, const TGRTMetaData& record, const Terminal& terminal) {
    print("{}\n", colored(terminal, Color::strong, printable(url.path())));
    printKind(terminal, record.fileType(), record.subFileType());
    const std::string name = record.displayName().value_or("");
    if (!name.empty()) printField(terminal, "name", {{printable(name), Color::plain}});
    printTaggings(terminal, record.taggings());
    std::vector<Word> words;
    for (const std::string& label : record.rejectedLabels())
        words.push_back({printable(label), Color::plain});
    printField(terminal, "rejected", words);
    printKeyValues(terminal, record.keyValues());
    if (!record.contentInfo()) return;
    words.clear();
    for (const std::string& path : record.contentInfo()->assetDependencyPaths())
        words.push_back({printable(path), Color::plain});
    printField(terminal, "needs", words);
    words.clear();
    for (const auto& info : record.contentInfo()->applicationInfos())
        words.push_back({printable(fmt::format("{} {}", info->appIdentifier().value_or(""),
                                               info->minimumVersion().value_or(""))),
                         Color::plain});
    printField(terminal, "opened by", words);
}

void run(const Options& options, ToolContext& context) {
    const std::uint64_t bits = (options.legacy ? std::uint64_t{kReadLegacyTaggings} : 0) |
                               (options.mapped ? std::uint64_t{kReadMappedTaggings} : 0);
    JsonItems json(context.format);
    context.forEachContentItem(options.paths, options.links, [&](const URL& url) {
        const auto record = readRecord(url, bits, context);
        if (!record) return;
        if (context.format == Format::table) {
            printRecord(url, *record, context.terminal());
        } else {
            json.add(jsonOfRecord(url, *record));
        }
    });
    if (context.format != Format::table) json.finish();
}

}  // namespace

void addReadCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("read", "Shows what files and bundles store about themselves");
    command.addOption("paths", options->paths, "Files and folders").required().valueName("PATH");
    command.addFollowFlag(options->links);
    command.addFlag("--legacy", options->legacy,
                    "Also the tags of retired vocabularies in old loops and presets");
    command.addFlag("--mapped", options->mapped, "Also what those tags are called today");
    command.footer("Example:\n  qvtag read --json --mapped Loops");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
