#include "CommandLine.h"
#include "commands/Commands.h"
#include "formats/TGRTFileNode.h"
#include "formats/bundle/TGRTBundleTypeValidators.h"
#include "formats/library/ContentNames.h"
#include "formats/library/FolderRejections.h"
#include "formats/settings/TGRTBinaryFileMetaDataReader.h"
#include "operations/TaggingEdit.h"
#include "operations/Verification.h"
#include "output/StandardStreams.h"
#include "platform/files/EditLock.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <memory>
#include <optional>
#include <set>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    std::vector<std::string> paths;
    LinksOutside links = LinksOutside::none;
    TaggingArguments tags;
    std::optional<std::string> name;
    bool isOfFolders = false;
    bool isDryRun = false;
    bool verifies = false;
    bool keepsTimes = false;
};

using Labels = std::set<std::string>;

/// What a write is to do, or has done, to one item or folder.
struct Change {
    URL url;
    std::shared_ptr<TGRTMetaData> record = {};  // as it is to be
    ObjectSet<TGRTTagging> added = {};
    ObjectSet<TGRTTagging> removed = {};
    Labels rejected = {};
    Labels accepted = {};
    std::string oldName = {};
    std::optional<std::string> newName = {};
    bool isWritten = false;
    FileStamp former = {};                          // of the file with the record when it was read
    std::optional<Verification> verification = {};  // of what was written
    std::vector<std::string> faults = {};           // what the verification found

    bool changesRejections() const { return !rejected.empty() || !accepted.empty(); }
    bool isNone() const { return added.empty() && removed.empty() && !changesRejections() && !newName; }
    void setRejections(const Labels& before, const Labels& after) {
        std::set_difference(after.begin(), after.end(), before.begin(), before.end(),
                            std::inserter(rejected, rejected.end()));
        std::set_difference(before.begin(), before.end(), after.begin(), after.end(),
                            std::inserter(accepted, accepted.end()));
    }
};

/// Why nothing can be written to an item of a kind that has no writer.
Error reasonNotWritten(const URL& url) {
    if (TGRTBinaryFileMetaDataReader::supportsFileExtension(url.pathExtension()))
        return errorOf(kErrorUnwritable, "data files are never written", {url.path()});
    Error error;
    TGRTFileNode::nodeWithFileURL(url)->readMetaDataWithOptions(0, &error);
    if (error.isSet()) return error;
    const URL folder = url.URLByDeletingLastPathComponent();
    const std::string reason =
        TGRTPatchTypeValidator().isValidContentTypeAtFileURL(folder)
            ? fmt::format("belongs to the patch it lies in, {}", printable(folder.path()))
            : "cannot be written";
    return errorOf(kErrorUnwritable, reason, {url.path()});
}

std::optional<Change> changeOfItem(const URL& url, const TaggingEdit& edit, const Options& options,
                                   ToolContext& context) {
    const auto node = TGRTFileNode::nodeWithFileURL(url);
    Error error;
    Change change{.url = url};
    if (!node->validator()) {
        context.itemFailed(reasonNotWritten(url));
        return std::nullopt;
    }
    change.record = node->readMetaDataWithOptions(0, &error);
    if (error.isSet()) {
        context.itemFailed(error);
        return std::nullopt;
    }
    if (!change.record) change.record = TGRTMetaData::init();
    const auto before = change.record->taggings();
    change.record->setTaggings(edit.apply(before));
    change.added = difference(change.record->taggings(), before);
    change.removed = difference(before, change.record->taggings());
    const Labels rejectedBefore = change.record->rejectedLabels();
    change.record->setRejectedLabels(edit.apply(rejectedBefore));
    change.setRejections(rejectedBefore, change.record->rejectedLabels());
    change.oldName = change.record->displayName().value_or("");
    if (options.name && *options.name != change.oldName) {
        change.newName = options.name;
        change.record->setDisplayName(*options.name);
    }
    return change;
}

/// A whole record is stored with the sub type that it holds, which must therefore be that of the new tags.
void updateSubType(const Change& change) {
    const bool hasOtherTags = !change.added.empty() || !change.removed.empty();
    const auto writer = std::dynamic_pointer_cast<TGRTBundleTaggingWriter>(
        TGRTFileNode::nodeWithFileURL(change.url)->taggingWriterForFileURL(change.url));
    if (hasOtherTags && writer)
        change.record->setSubFileType(writer->subTypeFromTaggings(change.record->taggings()));
}

ContentWriteOptions writeOptions(const Options& options, const FileStamp& former) {
    return {.keepsTimes = options.keepsTimes,
            .verifies = options.verifies,
            .isDryRun = options.isDryRun,
            .expected = former};
}

bool write(const Change& change, const Options& options, Error* error) {
    const ContentWriteOptions how = writeOptions(options, change.former);
    const auto node = TGRTFileNode::nodeWithFileURL(change.url);
    if (change.newName || change.changesRejections()) {
        updateSubType(change);
        const auto writer = node->metaDataWriterForFileURL(change.url);
        return writer && writer->writeMetaData(change.record, change.url, error, how);
    }
    const auto writer = node->taggingWriterForFileURL(change.url);
    return writer && writer->writeTaggings(change.record->taggings(), change.url, error, how);
}

/// Whether the item was written, or in a dry run would be; what a verification finds afterwards is reported
/// here.
bool carryOut(Change& change, const Options& options, ToolContext& context, Error* error) {
    if (options.verifies) {
        change.verification = Verification::before(change.url, error);
        if (!change.verification) return false;
    }
    const bool isDone = write(change, options, error);
    if (options.isDryRun) change.verification.reset();
    change.isWritten = isDone && !options.isDryRun;
    if (!isDone || !change.verification) return isDone;
    change.faults = change.verification->faultsAfterWriting(*change.record);
    for (const std::string& fault : change.faults)
        context.itemFailed(errorOf(kErrorUnwritable, fault, {change.url.path()}));
    return true;
}

/// Whether the record beside or in an item is a link that leads elsewhere: writing would change the file
/// there.
bool leadsAway(const std::string& record, const URL& url) {
    if (record == url.path()) return false;  // the walk has decided about items that are links themselves
    std::error_code reason;                  // the write fails for the same reason and reports it
    if (std::filesystem::status(record, reason).type() == std::filesystem::file_type::none) return false;
    const URL folder = isDirectory(url.path()) ? url : url.URLByDeletingLastPathComponent();
    return !LinkRule(folder.path(), LinksOutside::none).follows(record, false);
}

/// Whether the file with the record of an item or folder may be written to; if not, that is reported.
bool mayWriteTo(const std::string& record, const URL& url, const Options& options, ToolContext& context) {
    if (options.links == LinksOutside::all || !leadsAway(record, url)) return true;
    context.itemFailed(errorOf(kErrorInvalidArgument,
                               "leads out of its folder, and is written to only with --follow", {record}));
    return false;
}

/// Reads, changes and writes an item while holding its turn; tries once more if another program saves it
/// meanwhile.
std::optional<Change> editItem(const URL& url, const TaggingEdit& edit, const Options& options,
                               ToolContext& context) {
    Error error;
    const auto turn = EditLock::acquire(url.path(), &error);
    const std::string record = TGRTFileNode::nodeWithFileURL(url)->recordURL().path();
    if (!mayWriteTo(record, url, options, context)) return std::nullopt;
    constexpr int kAttempts = 10;
    for (int attempt = 0; turn && attempt < kAttempts; ++attempt) {
        const FileStamp former = FileStamp::ofFile(record);
        auto change = changeOfItem(url, edit, options, context);
        if (!change || change->isNone()) return change;
        change->former = former;
        error = {};
        if (carryOut(*change, options, context, &error)) return change;
        if (FileStamp::ofFile(record) == former) break;
    }
    if (!error.isSet()) fail(&error, kErrorUnwritable, "cannot be written", {url.path()});
    context.itemFailed(error);
    return std::nullopt;
}

/// Changes what a folder rejects, while holding the turn of its items.
std::optional<Change> editFolder(const URL& url, const TaggingEdit& edit, const Options& options,
                                 ToolContext& context) {
    const std::string& path = url.path();
    const std::string record = folderRecordPath(path);
    if (!isDirectory(path) || ContentNames().kindOf(url.lastPathComponent()) == ContentKind::bundle) {
        const char* reason =
            fileExists(path) ? "is an item and no folder of items: leave out --folder" : "no such folder";
        context.itemFailed(errorOf(kErrorInvalidArgument, reason, {path}));
        return std::nullopt;
    }
    if (!mayWriteTo(record, url, options, context)) return std::nullopt;
    Error error;
    const auto turn = EditLock::acquire(record, &error);
    Change change{.url = url, .former = FileStamp::ofFile(record)};
    const auto before = turn ? rejectedLabelsOfFolder(path, &error) : std::nullopt;
    if (before) {
        const Labels after = edit.apply(*before);
        change.setRejections(*before, after);
        if (change.isNone()) return change;
        const bool isDone =
            setRejectedLabelsOfFolder(after, path, &error, writeOptions(options, change.former));
        change.isWritten = isDone && !options.isDryRun;
        if (isDone) return change;
    }
    context.itemFailed(error);
    return std::nullopt;
}

Json jsonOfTaggings(const ObjectSet<TGRTTagging>& taggings) {
    Json json = Json::array();
    for (const auto& tagging : sortedTaggings(taggings)) json.push_back(jsonOfTagging(*tagging));
    return json;
}

Json jsonOfChange(const Change& change) {
    Json json;
    json["path"] = change.url.path();
    json["written"] = change.isWritten;
    json["added"] = jsonOfTaggings(change.added);
    json["removed"] = jsonOfTaggings(change.removed);
    json["rejected"] = change.rejected;
    json["accepted"] = change.accepted;
    json["name"] = change.newName ? Json{{"from", change.oldName}, {"to", *change.newName}} : Json();
    if (!change.verification) {
        json["verified"] = nullptr;
        return json;
    }
    json["verified"] = change.verification->summary();
    json["verified"]["faults"] = change.faults;
    return json;
}

void printChange(const Change& change, const Terminal& terminal) {
    print("{}\n", colored(terminal, Color::strong, printable(change.url.path())));
    for (const auto& tagging : sortedTaggings(change.removed))
        print("  - {}/{}\n", printable(tagging->category()), textOfTagging(*tagging));
    for (const auto& tagging : sortedTaggings(change.added))
        print("  + {}/{}\n", printable(tagging->category()), textOfTagging(*tagging));
    for (const std::string& label : change.accepted) print("  accept {}\n", printable(label));
    for (const std::string& label : change.rejected) print("  reject {}\n", printable(label));
    if (change.newName)
        print("  name \"{}\" becomes \"{}\"\n", printable(change.oldName), printable(*change.newName));
    if (change.isNone()) print("  {}\n", colored(terminal, Color::faint, "nothing to change"));
    if (change.verification)
        print("  {}\n", colored(terminal, Color::faint, change.verification->description()));
}

/// What is to be changed: the folders themselves, or the items at and below the paths.
std::vector<URL> targetsOf(const Options& options, ToolContext& context) {
    if (!options.isOfFolders) return context.contentItems(options.paths, options.links);
    std::vector<URL> folders;
    for (const std::string& path : options.paths) {
        folders.push_back(URL::fileURLWithPath(path));
        if (isValidUtf8(path)) continue;
        context.itemFailed(errorOf(kErrorInvalidArgument, "the name is not UTF-8", {path}));
        folders.pop_back();
    }
    return folders;
}

void run(const Options& options, ToolContext& context) {
    const auto edit = TaggingEdit::make(options.tags, context);
    if (!edit) return;
    if (edit->isEmpty() && !options.name)
        return context.usageFailed("nothing to write: --add, --remove, --reject, --accept or --name");
    if (options.name && !isValidUtf8(*options.name))
        return context.usageFailed(fmt::format("the name \"{}\" is not UTF-8", printable(*options.name)));
    Json json = Json::array();
    std::size_t written = 0;
    std::size_t unchanged = 0;
    for (const URL& url : targetsOf(options, context)) {
        const auto change = options.isOfFolders ? editFolder(url, *edit, options, context)
                                                : editItem(url, *edit, options, context);
        if (!change) continue;
        unchanged += change->isNone() ? 1 : 0;
        written += change->isWritten ? 1 : 0;
        if (context.format == Format::table) {
            printChange(*change, context.terminal());
        } else {
            json.push_back(jsonOfChange(*change));
        }
    }
    if (context.format != Format::table) return printJson(json, context.format);
    context.note(options.isDryRun
                     ? std::string("nothing was written: this is a dry run")
                     : fmt::format("{} written, {} unchanged",
                                   counted(written, options.isOfFolders ? "folder" : "item"), unchanged));
}

}  // namespace

void addWriteCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("write", "Changes the tags and the name that items store");
    command.addOption("paths", options->paths, "Files and folders").required().valueName("PATH");
    command.addFollowFlag(options->links);
    TaggingArguments& tags = options->tags;
    Option add =
        command.addOption("--add", tags.add, "Tag to add, or to give another level (0 to 1, or a percentage)")
            .valueName("CATEGORY/LABEL[=LEVEL]")
            .oneWordEach();
    Option remove = command.addOption("--remove", tags.remove, "Tag to remove, whatever its level")
                        .valueName("CATEGORY/LABEL")
                        .oneWordEach();
    command.addOption("--reject", tags.reject, "Tag that is not so: it is removed, and not derived again")
        .valueName("[CATEGORY/]LABEL")
        .oneWordEach();
    command.addOption("--accept", tags.accept, "Tag that may be derived again after all")
        .valueName("[CATEGORY/]LABEL")
        .oneWordEach();
    Option name = command.addOption("--name", options->name, "Display name").valueName("NAME");
    command.addFlag("--create", tags.creates,
                    "Also add, reject and accept tags that the taxonomy does not know");
    command.addFlag("--dry-run", options->isDryRun, "Show what would change, and write nothing");
    Option verify =
        command.addFlag("--verify", options->verifies,
                        "Compare audio and all that is not ours before and after, and read the record back");
    command.addFlag("--keep-times", options->keepsTimes, "Files keep their times of access and change");
    command
        .addFlag("--folder", options->isOfFolders,
                 "Reject and accept for the folders themselves: all that lies in them, now and later")
        .excludes(add)
        .excludes(remove)
        .excludes(name)
        .excludes(verify);
    command.footer(
        "The first \"/\" separates category and label: \"Sound Descriptors/Bright / Dark=25%\".\n"
        "Example:\n  qvtag write --add Genres/House --add \"Source/Bass=0.5\" --dry-run Loops\n"
        "  qvtag write --reject Drums --folder Loops");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
