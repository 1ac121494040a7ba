// Every call by which a tag write or an index run changes files, cut in every way: the user's files are whole
// afterwards, old or new, and the database opens and can be continued.

#include "CutCalls.h"
#include "contentdb/ContentDatabase.h"
#include "formats/FormatsSupport.h"
#include "formats/TGRTFileNode.h"
#include "media/loopfile/LCFileWriter.h"
#include "media/loopfile/LCFingerprint.h"
#include "platform/files/EditLock.h"
#include "platform/files/replacement/UnfinishedFile.h"
#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <map>
#include <optional>
#include <set>

#include <fmt/format.h>
#include <gmock/gmock.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <sys/xattr.h>

namespace qvct::test {
namespace {

namespace fs = std::filesystem;

/// Contents by path within a folder; a link is where it leads, after this.
const std::string kLink = "-> ";
using Files = std::map<std::string, std::string>;
using Act = std::function<bool(const std::string& folder)>;

bool isHidden(const fs::path& path) {
    return path.filename().string().starts_with('.');
}

Files filesIn(const std::string& folder, bool hidden = false) {
    Files files;
    for (const auto& entry : fs::recursive_directory_iterator(folder)) {
        if (!entry.is_regular_file() || isHidden(entry.path()) != hidden) continue;
        files[entry.path().lexically_relative(folder).string()] =
            entry.is_symlink() ? kLink + fs::read_symlink(entry.path()).string()
                               : readAll(entry.path().string());
    }
    return files;
}

/// Zeros become holes, and every file has an attribute, where the file system knows such.
void writeFile(const std::string& path, const std::string& contents) {
    fs::create_directories(fs::path(path).parent_path());
    if (contents.starts_with(kLink)) return fs::create_symlink(contents.substr(kLink.size()), path);
    constexpr std::size_t kBlock = 4096;
    static const std::string zeros(kBlock, '\0');
    std::ofstream file(path, std::ios::binary);
    for (std::size_t at = 0; at < contents.size(); at += kBlock) {
        const std::string_view block = std::string_view(contents).substr(at, kBlock);
        if (block != zeros) file.seekp(static_cast<std::streamoff>(at)) << block;
    }
    file.close();
    fs::resize_file(path, contents.size());
    ::setxattr(path.c_str(), "user.rating", "5", 1, 0);
}

/// Makes a folder hold these files and no others. Its path stays: databases know their items by it.
std::string restored(const TemporaryFolder& folder, const Files& files) {
    fs::remove_all(folder.path("user"));
    fs::create_directories(folder.path("user"));
    for (const auto& [name, contents] : files) writeFile(folder.path("user/" + name), contents);
    return folder.path("user");
}

enum class Outcome { succeeded, failed, died };

/// What the processes of a test see of each other.
struct Shared {
    static constexpr std::size_t kMostCalls = 20000;
    std::size_t calls;
    std::array<bool, kMostCalls> canBeHalf;
    std::array<bool, kMostCalls> isRemoval;
};

Shared& shared() {
    static auto* const memory = static_cast<Shared*>(
        ::mmap(nullptr, sizeof(Shared), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    return *memory;
}

void tellCalls() {
    const std::vector<Call> calls = callsMade();
    shared().calls = std::min(calls.size(), Shared::kMostCalls);
    for (std::size_t i = 0; i < shared().calls; ++i) {
        shared().canBeHalf[i] = calls[i].canBeHalf;
        shared().isRemoval[i] = calls[i].name.starts_with("unlink");
    }
}

/// Starts `act` in a process of its own: what it remembers of the folder ends with it.
pid_t start(const Act& act, const std::string& folder, const CutPlan& plan = {}) {
    shared().calls = 0;  // it is there before the process that shares it
    const pid_t child = ::fork();
    if (child != 0) return child;
    planCut(plan);
    if (plan.cut == Cut::termination) removeUnfinishedFilesWhenEnded();
    const bool isDone = act(folder);
    tellCalls();
    ::_exit(isDone ? 0 : 1);
}

Outcome outcomeOf(pid_t process) {
    int status = 0;
    ::waitpid(process, &status, 0);
    if (WIFSIGNALED(status) && WTERMSIG(status) == SIGTERM) return Outcome::died;
    EXPECT_TRUE(WIFEXITED(status)) << "ended by signal " << WTERMSIG(status);
    const int code = WEXITSTATUS(status);
    return code == 0 ? Outcome::succeeded : code == 1 ? Outcome::failed : Outcome::died;
}

Outcome run(const Act& act, const std::string& folder, const CutPlan& plan = {}) {
    return outcomeOf(start(act, folder, plan));
}

struct CutRun {
    Outcome outcome;
    bool isRemovalCut;  ///< The cut call was to remove a file.
};

/// Cuts every call that `act` makes on a folder with these files; how many cuts that were. Death after a call
/// is death before the next one.
std::size_t cutEveryCall(const TemporaryFolder& folder, const Files& before, const Act& act,
                         const std::function<void(const std::string& folder, const CutRun& run)>& check) {
    const std::string path = restored(folder, before);
    EXPECT_EQ(run(act, path), Outcome::succeeded);
    const Shared calls = shared();
    std::size_t cuts = 0;
    for (std::size_t point = 0; point < calls.calls; ++point) {
        for (const Cut cut : {Cut::ioError, Cut::diskFull, Cut::interrupted, Cut::shortWrite, Cut::death,
                              Cut::halfThenDeath}) {
            const bool needsHalf =
                cut == Cut::interrupted || cut == Cut::shortWrite || cut == Cut::halfThenDeath;
            if (needsHalf && !calls.canBeHalf[point]) continue;
            restored(folder, before);
            SCOPED_TRACE(fmt::format("call {} of {}, cut {}", point, calls.calls, static_cast<int>(cut)));
            const Outcome outcome = run(act, path, {.cut = cut, .point = point});
            check(path, {outcome, calls.isRemoval[point]});
            cuts += outcome == Outcome::died || shared().calls > point ? 1 : 0;
            if (testing::Test::HasFailure()) return cuts;
        }
    }
    return cuts;
}

struct Item {
    std::string name;
    Files files;
};

std::vector<Item> itemsOfEveryKind() {
    const Wav wav;
    const Wav bigEndian{"RIFX"};
    const Wav with64Bits{"RF64"};
    const std::string manyBlocks = wav.data(20001);
    const std::string silence = wav.chunk("data", std::string(40000, '\0'));
    const std::string stored = serializePropertyList(
        Dictionary{{"Tagging", taggingDictionary("Genres", "Techno")}}, PropertyListFormat::binary);
    const std::string text = serializePropertyList(
        Dictionary{{"Mine", "kept"}, {"Tagging", taggingDictionary("Genres", "Techno")}},
        PropertyListFormat::xml);
    const std::string preset = "Cutoff 3\n<tagging>\nAttribs = 4001,6004\n</tagging>\n";
    return {
        {"loop.wav", {{"loop.wav", wav.file(wav.acid(0, 60, 4, 120) + wav.format() + manyBlocks)}}},
        {"link.wav",
         {{"link.wav", kLink + "real/shot.wav"}, {"real/shot.wav", wav.file(wav.format() + wav.data(5000))}}},
        {"Loop.loopdata", {{"Loop.loopdata", stored}}},
        {"behind.wav", {{"behind.wav", wav.file(wav.format() + manyBlocks + wav.cues({1, 2, 3}))}}},
        {"sparse.wav", {{"sparse.wav", wav.file(wav.format() + silence + wav.cues({1}))}}},
        {"big.wav", {{"big.wav", bigEndian.file(bigEndian.format() + bigEndian.data())}}},
        {"long.wav", {{"long.wav", with64Bits.longFile(with64Bits.format(), 9000, wav.cues({5}))}}},
        {"shot.aif", {{"shot.aif", Aiff::file(Aiff::common() + Aiff::sound(18000))}}},
        {"loop.caf", {{"loop.caf", Caf::file(Caf::description() + Caf::data(12000))}}},
        {"open.caf", {{"open.caf", Caf::file(Caf::description() + Caf::openData())}}},
        {"New.patch", {{"New.patch/data.plist", "x"}}},
        {"Old.patch", {{"Old.patch/data.plist", "x"}, {"Old.patch/tags.plist", stored}}},
        {"Song.ostrax", {{"Song.ostrax/Media/x", "x"}}},
        {"New.cst", {{"New.cst", "settings"}}},
        {"New.sxv", {{"New.sxv", "settings"}}},
        {"Old.pst", {{"Old.pst", "settings"}, {"Old.pst.plist", stored}}},
        {"Text.cst", {{"Text.cst", "settings"}, {"Text.cst.plist", text}}},
        {"Lead.vcp", {{"Lead.vcp", preset}}},
        {"Bare.vcp", {{"Bare.vcp", "Cutoff 3\n"}}},
    };
}

std::shared_ptr<TGRTFileNode> nodeOf(const std::string& path) {
    return TGRTFileNode::nodeWithFileURL(urlOf(path));
}

bool writeTaggings(const std::string& path, const ObjectSet<TGRTTagging>& taggings) {
    const auto writer = nodeOf(path)->taggingWriterForFileURL(urlOf(path));
    return writer && writer->writeTaggings(taggings, urlOf(path), nullptr);
}

bool writeTwoTags(const std::string& path) {
    return writeTaggings(path, taggingsOf({{"Genres", "House"}, {"Source", "Bass"}}, 0.5));
}

bool writeOtherTag(const std::string& path) {
    return writeTaggings(path, taggingsOf({{"Descriptors", "Dry"}}, 0.25));
}

bool writeNext(const std::string& path) {
    return writeTaggings(path, taggingsOf({{"Genres", "Techno"}}, 0.75));
}

bool writeContentInfo(const std::string& path) {
    const auto writer = nodeOf(path)->contentInfoWriterForFileURL(urlOf(path));
    const auto info = TGRTContentInfo::init();
    info->updateDependencyPaths({"Samples/Kick.wav"});
    return writer && writer->writeContentInfo(info, urlOf(path), nullptr);
}

/// As a host does: what it read is still there when it writes.
bool writeName(const std::string& path) {
    const auto turn = EditLock::acquire(path);
    const auto node = nodeOf(path);
    ContentWriteOptions how;
    how.keepsTimes = true;
    how.expected = FileStamp::ofFile(node->recordURL().path());
    auto record = node->readMetaDataWithOptions(0, nullptr);
    if (!record) record = TGRTMetaData::init();
    record->setDisplayName("Renamed");
    const auto writer = node->metaDataWriterForFileURL(urlOf(path));
    return writer && writer->writeMetaData(record, urlOf(path), nullptr, how);
}

using Write = bool (*)(const std::string& path);
constexpr std::array<Write, 3> kWrites = {writeTwoTags, writeName, writeContentInfo};

std::optional<std::uint64_t> audioHash(const std::string& path) {
    const auto fingerprint = fingerprintOfFile(urlOf(path));
    return fingerprint ? std::optional(fingerprint->audioHash) : std::nullopt;
}

/// What a killed process left can be read by nobody whom the files of the test do not let.
void expectPrivate(const std::string& folder) {
    for (const auto& [name, contents] : filesIn(folder, true)) {
        const auto mode = fs::status(folder + "/" + name).permissions();
        EXPECT_EQ(mode & (fs::perms::others_all | fs::perms::group_write), fs::perms::none) << name;
    }
}

Act actOn(const Item& item, Write write) {
    return [&item, write](const std::string& folder) { return write(folder + "/" + item.name); };
}

/// Old or new, nothing between; what was left behind is gone after the next write.
void expectOldOrNew(const Item& item, const Files& after, const std::string& folder, const CutRun& cut) {
    const Files now = filesIn(folder);
    const bool isOld = now == item.files;
    const bool isNew = now == after;
    EXPECT_TRUE(isOld || isNew) << item.name;
    EXPECT_TRUE(isNew || cut.outcome != Outcome::succeeded) << item.name << " was said to be written";
    EXPECT_TRUE(isOld || cut.outcome != Outcome::failed) << item.name << " was said not to be written";
    expectPrivate(folder);
    if (filesIn(folder, true).empty()) return;
    EXPECT_TRUE(cut.outcome == Outcome::died || cut.isRemovalCut) << "a file was left behind";
    EXPECT_EQ(run(actOn(item, writeNext), folder), Outcome::succeeded);
    EXPECT_TRUE(filesIn(folder, true).empty()) << "what was left behind is still there";
}

std::size_t cutWrite(const Item& item, Write write) {
    const TemporaryFolder folder;
    const std::string path = restored(folder, item.files);
    const auto hash = audioHash(path + "/" + item.name);
    EXPECT_EQ(run(actOn(item, write), path), Outcome::succeeded);
    EXPECT_EQ(audioHash(path + "/" + item.name), hash);
    const Files after = filesIn(path);
    EXPECT_NE(after, item.files);
    return cutEveryCall(folder, item.files, actOn(item, write),
                        [&](const std::string& where, const CutRun& cut) {
                            expectOldOrNew(item, after, where, cut);
                            EXPECT_EQ(audioHash(where + "/" + item.name), hash);
                        });
}

/// The item after a write, with a record that the next one has to replace.
Item afterWrite(const Item& item, Write write) {
    const TemporaryFolder folder;
    const std::string path = restored(folder, item.files);
    EXPECT_EQ(run(actOn(item, write), path), Outcome::succeeded);
    return {item.name, filesIn(path)};
}

/// The one file in which two states of an item differ.
std::string differingFile(const Files& before, const Files& after) {
    for (const auto& [name, contents] : after) {
        const auto old = before.find(name);
        if (old == before.end() || old->second != contents) return name;
    }
    return {};
}

/// How another program saves: beside the file and renamed over it, or in place.
enum class Save { byRenaming, inPlace };

void save(const std::string& path, const std::string& contents, Save how) {
    const std::string written = how == Save::byRenaming ? path + ".saved" : path;
    std::ofstream(written, std::ios::binary) << contents;
    if (how == Save::byRenaming) fs::rename(written, path);
}

/// Another program saves the item right before every call of a write, which ends right before every later one
/// or goes on. What that program saved stands there afterwards, as it was or with our change.
std::size_t saveBeforeEveryCall(const Item& item, Write write, Save how, Cut end = Cut::death) {
    const TemporaryFolder folder;
    const Files saved = afterWrite(item, writeOtherTag).files;
    const Files savedAndWritten = afterWrite({item.name, saved}, write).files;
    const std::string name = differingFile(item.files, saved);
    const std::string contents = saved.at(name);
    const std::string path = restored(folder, item.files);
    EXPECT_EQ(run(actOn(item, write), path), Outcome::succeeded);
    const std::size_t calls = shared().calls;
    std::size_t cuts = 0;
    for (std::size_t at = 0; at < calls; ++at) {
        for (std::size_t death = at; death <= calls; ++death) {
            restored(folder, item.files);
            SCOPED_TRACE(fmt::format("{}: saved before call {}, death before {}", item.name, at, death));
            CutPlan plan{.cut = death < calls ? end : Cut::none, .point = death};
            plan.otherProgram = [&] {
                fs::create_directories(fs::path(path + "/" + name).parent_path());
                save(path + "/" + name, contents, how);
            };
            plan.interruptedAt = at;
            const Outcome outcome = run(actOn(item, write), path, plan);
            const Files now = filesIn(path);
            const Files hidden = filesIn(path, true);
            const bool isAside = outcome == Outcome::died &&
                                 std::any_of(hidden.begin(), hidden.end(),
                                             [&](const auto& each) { return each.second == contents; });
            EXPECT_TRUE(now == saved || now == savedAndWritten || isAside) << "what was saved is lost";
            EXPECT_TRUE(outcome == Outcome::died || hidden.empty()) << "a file was left behind";
            if (isAside && now != saved && now != savedAndWritten) {
                EXPECT_EQ(run(actOn(item, writeNext), path), Outcome::succeeded);
                EXPECT_EQ(filesIn(path, true), hidden) << "what was saved was removed";
            }
            ++cuts;
            if (testing::Test::HasFailure()) return cuts;
        }
    }
    return cuts;
}

/// Two processes of ours at once, one of which dies before each of its calls: the other one's tag is there.
std::size_t killOneOfTwo(const Item& item) {
    const TemporaryFolder folder;
    const std::string path = restored(folder, item.files);
    const auto hash = audioHash(path + "/" + item.name);
    EXPECT_EQ(run(actOn(item, writeName), path), Outcome::succeeded);
    const std::size_t calls = shared().calls;
    const std::array<Files, 3> possible = {afterWrite(item, writeTwoTags).files,
                                           afterWrite(afterWrite(item, writeTwoTags), writeName).files,
                                           afterWrite(afterWrite(item, writeName), writeTwoTags).files};
    for (std::size_t point = 0; point < calls; ++point) {
        restored(folder, item.files);
        SCOPED_TRACE(fmt::format("{}: one of two dies before call {} of {}", item.name, point, calls));
        const pid_t one = start(actOn(item, writeName), path, {.cut = Cut::death, .point = point});
        const pid_t other = start(actOn(item, writeTwoTags), path);
        EXPECT_EQ(outcomeOf(other), Outcome::succeeded);
        outcomeOf(one);
        EXPECT_EQ(run(actOn(item, writeTwoTags), path), Outcome::succeeded);
        EXPECT_THAT(possible, testing::Contains(filesIn(path)));
        EXPECT_EQ(audioHash(path + "/" + item.name), hash);
        if (testing::Test::HasFailure()) break;
    }
    return calls;
}

class NameDescriber : public contentdb::ItemDescriber {
  public:
    std::optional<contentdb::IndexedItem> describe(const std::string& path, Error* /*error*/) override {
        contentdb::IndexedItem item;
        item.name = urlOf(path).lastPathComponentWithoutExtension();
        item.fileType = kFileTypeAudioFile;
        item.payloadHash = item.name;
        item.taggings = {{item.name, "Source", {}, {}, contentdb::Provenance::automatic, "names"}};
        return item;
    }
};

bool indexFolder(const std::string& folder) {
    contentdb::IndexOptions options;
    options.folders = {folder + "/library"};
    options.database = folder + "/db";
    options.workers = 1;
    options.prune = true;
    options.longestBatch = std::chrono::milliseconds(0);  // many commits
    return contentdb::indexLibrary(options, [] { return std::make_unique<NameDescriber>(); }).has_value();
}

std::vector<std::string> namesIndexed(const std::string& folder) {
    Error error;
    const auto database = contentdb::ContentDatabase::open(folder + "/db", &error);
    EXPECT_TRUE(database) << error.message();
    if (!database) return {};
    EXPECT_TRUE(database->check(&error)) << error.message();
    const auto found = database->search(*contentdb::parseQuery("", *database->vocabulary(), nullptr), 1000);
    std::vector<std::string> names;
    for (const auto& each : found.value_or(std::vector<contentdb::Found>{})) names.push_back(each.item.name);
    return names;
}

/// What an index run finds: a library whose database knows `known` items, two of which have gone since, and
/// `added` new ones.
struct Change {
    std::size_t known;
    std::size_t added;
    bool isDamaged = false;

    std::size_t gone() const { return std::min<std::size_t>(known, 2); }
    std::size_t items() const { return known - gone() + added; }
};

Files changedLibrary(const TemporaryFolder& folder, const Change& change) {
    const std::string path = restored(folder, {});
    for (std::size_t i = 0; i < change.known; ++i)
        folder.write(fmt::format("user/library/Old {}.wav", i), "old");
    EXPECT_TRUE(change.known == 0 || indexFolder(path));
    for (std::size_t i = 0; i < change.gone(); ++i)
        fs::remove(folder.path(fmt::format("user/library/Old {}.wav", i)));
    for (std::size_t i = 0; i < change.added; ++i)
        folder.write(fmt::format("user/library/New {}.wav", i), "new");
    if (change.isDamaged) {
        constexpr std::size_t page = 8192;
        std::string database = readAll(path + "/db");
        const std::size_t intact = database.size() / page / 2 * page;
        database.replace(intact, std::string::npos, std::string(database.size() - intact, 'x'));
        folder.write("user/db", database);
    }
    return filesIn(path);
}

std::size_t cutIndexRun(const Change& change) {
    const TemporaryFolder folder;
    const Files files = changedLibrary(folder, change);
    // Before its first commit a database holds nothing yet that could be opened.
    const bool hasOpened = change.known > 0 && !change.isDamaged;
    return cutEveryCall(folder, files, indexFolder, [&](const std::string& path, const CutRun& /*cut*/) {
        if (hasOpened) namesIndexed(path);
        EXPECT_TRUE(indexFolder(path)) << "cannot be continued";
        EXPECT_EQ(namesIndexed(path).size(), change.items());
    });
}

bool mergeSlices(const std::string& folder) {
    return contentdb::mergeDatabases({folder + "/slice1", folder + "/slice2"}, folder + "/db");
}

constexpr std::size_t kItemsOfSlice = 12;

/// The databases of two libraries, named as `mergeSlices` finds them.
Files slices(const TemporaryFolder& folder) {
    Files files;
    for (const std::string slice : {"slice1", "slice2"}) {
        const std::string path = restored(folder, {});
        for (std::size_t i = 0; i < kItemsOfSlice; ++i)
            folder.write(fmt::format("user/library/{} {}.wav", slice, i), "sound");
        EXPECT_TRUE(indexFolder(path));
        files[slice] = readAll(path + "/db");
    }
    return files;
}

std::size_t cutMerges() {
    const TemporaryFolder folder;
    const Files files = slices(folder);
    return cutEveryCall(folder, files, mergeSlices, [&](const std::string& path, const CutRun& cut) {
        const bool isThere = fs::exists(path + "/db");
        EXPECT_TRUE(isThere || cut.outcome != Outcome::succeeded);
        EXPECT_TRUE(isThere || mergeSlices(path)) << "cannot be repeated";
        EXPECT_EQ(namesIndexed(path).size(), 2 * kItemsOfSlice);
        for (const auto& [name, contents] : files) EXPECT_EQ(readAll(path + "/" + name), contents);
    });
}

/// Every change of a file is flushed before that file takes its place, nothing is written to it afterwards,
/// and then its folder is flushed.
void expectFlushesInOrder(const std::vector<Call>& calls, bool isReplaced = true) {
    std::map<std::string, bool> isFlushed;
    std::set<std::string> unflushedFolders;
    std::size_t places = 0;
    for (const Call& call : calls) {
        SCOPED_TRACE(call.name + " " + call.path);
        if (call.name == "fsync" || call.name == "fdatasync") {
            isFlushed[call.path] = true;
            unflushedFolders.erase(call.path);
        } else if (call.name.starts_with("rename")) {
            const std::size_t arrow = call.path.find(" > ");
            const std::string from = call.path.substr(0, arrow);
            const std::string to = call.path.substr(arrow + 3);
            const bool isWhole = !isFlushed.contains(from) || isFlushed[from];    // or was so before
            const bool isLog = from.ends_with("-wal") || from.ends_with("-shm");  // put aside as it is
            EXPECT_TRUE(isWhole || isLog) << "takes its place before it is flushed";
            isFlushed[to] = isWhole;
            if (isHidden(to)) continue;
            unflushedFolders.insert(fs::path(to).parent_path().string());
            ++places;
        } else if (call.name.starts_with("unlink")) {
            EXPECT_TRUE(unflushedFolders.empty()) << "the old file goes before the folder is flushed";
        } else if (call.name != "mkdir") {
            isFlushed[call.path] = false;
        }
    }
    EXPECT_EQ(places > 0, isReplaced);
    EXPECT_TRUE(unflushedFolders.empty()) << *unflushedFolders.begin() << " is not flushed";
}

/// What a process that does it calls.
std::vector<Call> callsOf(const Act& act, const std::string& folder) {
    planCut({});
    EXPECT_TRUE(act(folder));
    return callsMade();
}

/// In memory, where flushing costs nothing, on systems that keep files there.
class CrashPoints : public testing::Test {
  protected:
    static void SetUpTestSuite() {
        if (fs::is_directory("/dev/shm")) ::setenv("TMPDIR", "/dev/shm", 0);
        ::umask(027);
        // What is loaded once need not be loaded by every process.
        const TemporaryFolder folder;
        const Item item = itemsOfEveryKind().front();
        for (const Write write : kWrites) write(restored(folder, item.files) + "/" + item.name);
    }
};

/// One test an item, so that they can run at once.
class CrashPointsOfWrites : public CrashPoints, public testing::WithParamInterface<Item> {};

TEST_P(CrashPointsOfWrites, LoseNothing) {
    const Item& item = GetParam();
    std::size_t cuts = 0;
    for (const Write write : kWrites) {
        cuts += cutWrite(item, write);
        cuts += cutWrite(afterWrite(item, writeOtherTag), write);
    }
    std::size_t saves = 0;
    for (const Write write : kWrites) {
        for (const Save how : {Save::byRenaming, Save::inPlace})
            saves += saveBeforeEveryCall(item, write, how);
    }
    saves += saveBeforeEveryCall(item, writeName, Save::byRenaming, Cut::termination);
    const std::size_t pairs = killOneOfTwo(item);
    std::printf(
        "crash points of writes to %s: %zu calls cut, %zu with another program's save, %zu of two at "
        "once\n",
        item.name.c_str(), cuts, saves, pairs);
    EXPECT_GE(cuts + saves + pairs, 350U);
}

TEST_P(CrashPointsOfWrites, FlushInOrder) {
    const Item& item = GetParam();
    for (const Item& state : {item, afterWrite(item, writeOtherTag)}) {
        const TemporaryFolder folder;
        expectFlushesInOrder(callsOf(actOn(state, writeTwoTags), restored(folder, state.files)));
    }
}

INSTANTIATE_TEST_SUITE_P(EveryKind, CrashPointsOfWrites, testing::ValuesIn(itemsOfEveryKind()),
                         [](const auto& instance) {
                             std::string name = instance.param.name;
                             std::replace(name.begin(), name.end(), '.', '_');
                             return name;
                         });

class CrashPointsOfIndexRuns : public CrashPoints, public testing::WithParamInterface<Change> {};

TEST_P(CrashPointsOfIndexRuns, LoseNothing) {
    const std::size_t cuts = cutIndexRun(GetParam());
    std::printf("crash points of an index run: %zu\n", cuts);
    EXPECT_GE(cuts, 250U);
}

INSTANTIATE_TEST_SUITE_P(EveryState, CrashPointsOfIndexRuns,
                         testing::Values(Change{0, 8}, Change{8, 6}, Change{8, 6, true}),
                         [](const auto& instance) {
                             return fmt::format("{}Known{}Added{}", instance.param.known,
                                                instance.param.added,
                                                instance.param.isDamaged ? "Damaged" : "");
                         });

TEST_F(CrashPoints, OfMergesLoseNothing) {
    const std::size_t cuts = cutMerges();
    std::printf("crash points of merges: %zu\n", cuts);
    EXPECT_GE(cuts, 350U);
}

TEST_P(CrashPointsOfIndexRuns, FlushInOrder) {
    const TemporaryFolder folder;
    const Files files = changedLibrary(folder, GetParam());
    const bool isReplaced = GetParam().known == 0 || GetParam().isDamaged;
    expectFlushesInOrder(callsOf(indexFolder, restored(folder, files)), isReplaced);
}

TEST_F(CrashPoints, OfAWriteLeaveNothingThatAnotherOneRemoves) {
    const TemporaryFolder folder;
    const Item item = itemsOfEveryKind().front();
    const std::string path = restored(folder, item.files);
    EXPECT_EQ(run(actOn(item, writeTwoTags), path), Outcome::succeeded);
    const std::size_t calls = shared().calls;
    for (std::size_t at = 0; at < calls; ++at) {
        restored(folder, item.files);
        CutPlan plan;
        plan.otherProgram = [&path] {
            const Files unfinished = filesIn(path, true);
            removeLeftFiles(path + "/./");  // by another name, since it was looked through a moment ago
            if (filesIn(path, true) != unfinished) ::_exit(1);
        };
        plan.interruptedAt = at;
        EXPECT_EQ(run(actOn(item, writeTwoTags), path, plan), Outcome::succeeded) << "call " << at;
    }
}

TEST_F(CrashPoints, WithoutLocksLeaveNothingForMoreThanADay) {
    const TemporaryFolder folder;
    const Item item = itemsOfEveryKind().front();
    for (const bool isOld : {false, true}) {
        const std::string path = restored(folder, item.files);
        folder.write("user/.qvct-1-0.tmp", "left, or still being written");
        const CutPlan plan{.hasNoLocks = true, .ahead = std::time_t{isOld ? 25 : 23} * 60 * 60};
        EXPECT_EQ(run(actOn(item, writeTwoTags), path, plan), Outcome::succeeded);
        EXPECT_EQ(filesIn(path, true).empty(), isOld);
    }
}

TEST_F(CrashPoints, OfMergesFlushInOrder) {
    const TemporaryFolder folder;
    expectFlushesInOrder(callsOf(mergeSlices, restored(folder, slices(folder))));
}

}  // namespace
}  // namespace qvct::test
