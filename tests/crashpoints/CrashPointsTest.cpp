// Every call by which a tag write or an index run changes files, cut in every way: the user's files are whole
// afterwards, old or new, and the database opens and can be continued.

#include "CutCalls.h"
#include "contentdb/ContentDatabase.h"
#include "formats/FormatsSupport.h"
#include "formats/TGRTFileNode.h"
#include "platform/LCFileWriter.h"
#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <map>
#include <optional>

#include <fmt/format.h>
#include <gmock/gmock.h>
#include <sys/mman.h>
#include <sys/wait.h>

namespace qvct::test {
namespace {

namespace fs = std::filesystem;

/// Contents by path within a folder.
using Files = std::map<std::string, std::string>;
using Act = std::function<bool(const std::string& folder)>;

bool isHidden(const fs::path& path) {
    return path.filename().string().starts_with('.');
}

Files filesIn(const std::string& folder, bool hidden = false) {
    Files files;
    for (const auto& entry : fs::recursive_directory_iterator(folder)) {
        if (entry.is_regular_file() && isHidden(entry.path()) == hidden)
            files[fs::relative(entry.path(), folder).string()] = readAll(entry.path().string());
    }
    return files;
}

/// Makes a folder hold these files and no others. Its path stays: databases know their items by it.
std::string restored(const TemporaryFolder& folder, const Files& files) {
    fs::remove_all(folder.path("user"));
    fs::create_directories(folder.path("user"));
    for (const auto& [name, contents] : files) folder.write("user/" + name, contents);
    return folder.path("user");
}

enum class Outcome { succeeded, failed, died };

struct CutRun {
    Outcome outcome = Outcome::died;
    bool wasCut = false;
};

/// Runs `act` in a process of its own.
CutRun runCut(const Act& act, const std::string& folder, Cut cut, std::uint64_t point) {
    auto* const reached = static_cast<bool*>(
        ::mmap(nullptr, sizeof(bool), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    const pid_t child = ::fork();
    if (child == 0) {
        cutCall(cut, point);
        const bool isDone = act(folder);
        *reached = callsMade().size() > point;
        ::_exit(isDone ? 0 : 1);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    EXPECT_TRUE(WIFEXITED(status)) << "ended by signal " << WTERMSIG(status);
    const int code = WEXITSTATUS(status);
    const bool wasReached = *reached || code == kDiedOfCut;
    ::munmap(reached, sizeof(bool));
    return {code == 0 ? Outcome::succeeded : code == 1 ? Outcome::failed : Outcome::died, wasReached};
}

/// Cuts every call that `act` makes on a folder with these files; how many cuts that were.
std::size_t cutEveryCall(const TemporaryFolder& folder, const Files& before, const Act& act,
                         const std::function<void(const std::string& folder, Outcome outcome)>& check) {
    const std::string path = restored(folder, before);
    cutCall(Cut::none, 0);
    EXPECT_TRUE(act(path));
    const std::vector<bool> calls = callsMade();
    std::size_t cuts = 0;
    for (std::size_t point = 0; point < calls.size(); ++point) {
        for (const Cut cut : {Cut::error, Cut::shortWrite, Cut::deathBefore, Cut::deathAfter}) {
            if (cut == Cut::shortWrite && !calls[point]) continue;
            restored(folder, before);
            SCOPED_TRACE(fmt::format("call {} of {}, cut {}", point, calls.size(), static_cast<int>(cut)));
            const CutRun run = runCut(act, path, cut, point);
            check(path, run.outcome);
            cuts += run.wasCut ? 1 : 0;
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
    const std::string manyBlocks = wav.data(300001);
    const std::string stored = serializePropertyList(
        Dictionary{{"Tagging", taggingDictionary("Genres", "Techno")}}, PropertyListFormat::binary);
    return {
        {"loop.wav", {{"loop.wav", wav.file(wav.acid(0, 60, 4, 120) + wav.format() + manyBlocks)}}},
        {"behind.wav", {{"behind.wav", wav.file(wav.format() + manyBlocks + wav.cues({1, 2, 3}))}}},
        {"big.wav", {{"big.wav", bigEndian.file(bigEndian.format() + bigEndian.data())}}},
        {"long.wav", {{"long.wav", with64Bits.longFile(with64Bits.format(), 9000, wav.cues({5}))}}},
        {"shot.aif", {{"shot.aif", Aiff::file(Aiff::common() + Aiff::sound(90000))}}},
        {"loop.caf", {{"loop.caf", Caf::file(Caf::description() + Caf::data(50000))}}},
        {"open.caf", {{"open.caf", Caf::file(Caf::description() + Caf::openData())}}},
        {"New.patch", {{"New.patch/data.plist", "x"}}},
        {"Old.patch", {{"Old.patch/data.plist", "x"}, {"Old.patch/tags.plist", stored}}},
        {"Song.ostrax", {{"Song.ostrax/Media/x", "x"}}},
        {"New.cst", {{"New.cst", "settings"}}},
        {"Old.pst", {{"Old.pst", "settings"}, {"Old.pst.plist", stored}}},
        {"Lead.vcp", {{"Lead.vcp", "Cutoff 3\n<tagging>\nAttribs = 4001,6004\n</tagging>\n"}}},
    };
}

bool writeTaggings(const std::string& path) {
    const auto node = TGRTFileNode::nodeWithFileURL(urlOf(path));
    const auto writer = node->taggingWriterForFileURL(urlOf(path));
    return writer && writer->writeTaggings(taggingsOf({{"Genres", "House"}, {"Source", "Bass"}}, 0.5),
                                           urlOf(path), nullptr);
}

bool writeRecord(const std::string& path) {
    const auto node = TGRTFileNode::nodeWithFileURL(urlOf(path));
    auto record = node->readMetaDataWithOptions(0, nullptr);
    if (!record) record = TGRTMetaData::init();
    record->setDisplayName("Renamed");
    const auto writer = node->metaDataWriterForFileURL(urlOf(path));
    return writer && writer->writeMetaData(record, urlOf(path), nullptr);
}

std::optional<std::uint64_t> audioHash(const std::string& path) {
    const auto fingerprint = fingerprintOfFile(urlOf(path));
    return fingerprint ? std::optional(fingerprint->audioHash) : std::nullopt;
}

/// Old or new, nothing between, and no other file about.
void expectOldOrNew(const Item& item, const Files& after, const std::string& folder, Outcome outcome) {
    const Files now = filesIn(folder);
    const bool isOld = now == item.files;
    const bool isNew = now == after;
    EXPECT_TRUE(isOld || isNew) << item.name;
    EXPECT_TRUE(isNew || outcome != Outcome::succeeded) << item.name << " was said to be written";
    EXPECT_TRUE(isOld || outcome != Outcome::failed) << item.name << " was said not to be written";
    EXPECT_TRUE(outcome == Outcome::died || filesIn(folder, true).empty()) << "a file was left behind";
}

std::size_t cutTagWrite(const Item& item, bool (*write)(const std::string&)) {
    SCOPED_TRACE(item.name);
    const Act act = [&](const std::string& folder) { return write(folder + "/" + item.name); };
    const TemporaryFolder folder;
    const std::string path = restored(folder, item.files);
    const auto hash = audioHash(path + "/" + item.name);
    EXPECT_TRUE(act(path));
    EXPECT_EQ(audioHash(path + "/" + item.name), hash);
    const Files after = filesIn(path);
    EXPECT_NE(after, item.files);
    return cutEveryCall(folder, item.files, act, [&](const std::string& where, Outcome outcome) {
        expectOldOrNew(item, after, where, outcome);
        EXPECT_EQ(audioHash(where + "/" + item.name), hash);
    });
}

/// The item with a record in it, which the next write has to replace.
Item described(const Item& item) {
    const TemporaryFolder folder;
    const std::string path = restored(folder, item.files);
    const auto writer = TGRTFileNode::nodeWithFileURL(urlOf(path + "/" + item.name))
                            ->taggingWriterForFileURL(urlOf(path + "/" + item.name));
    EXPECT_TRUE(writer->writeTaggings(taggingsOf({{"Descriptors", "Dry"}}, 0.25),
                                      urlOf(path + "/" + item.name), nullptr));
    return {item.name, filesIn(path)};
}

std::size_t cutTagWrites() {
    std::size_t cuts = 0;
    for (const Item& item : itemsOfEveryKind()) {
        for (const auto& write : {writeTaggings, writeRecord})
            cuts += cutTagWrite(item, write) + cutTagWrite(described(item), write);
    }
    return cuts;
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
    EXPECT_TRUE(database) << error.message;
    if (!database) return {};
    EXPECT_TRUE(database->check(&error)) << error.message;
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
        constexpr std::size_t intact = 8192;
        std::string database = readAll(path + "/db");
        database.replace(intact, std::string::npos, std::string(database.size() - intact, 'x'));
        folder.write("user/db", database);
    }
    return filesIn(path);
}

std::size_t cutIndexRuns() {
    std::size_t cuts = 0;
    for (const Change& change : {Change{0, 8}, Change{8, 6}, Change{8, 6, true}}) {
        SCOPED_TRACE(fmt::format("index of {} items, then {} new ones", change.known, change.added));
        const TemporaryFolder folder;
        const Files files = changedLibrary(folder, change);
        // Before its first commit a database holds nothing yet that could be opened.
        const bool hasOpened = change.known > 0 && !change.isDamaged;
        cuts += cutEveryCall(folder, files, indexFolder, [&](const std::string& path, Outcome /*outcome*/) {
            if (hasOpened) namesIndexed(path);
            EXPECT_TRUE(indexFolder(path)) << "cannot be continued";
            EXPECT_EQ(namesIndexed(path).size(), change.items());
        });
    }
    return cuts;
}

bool mergeSlices(const std::string& folder) {
    return contentdb::mergeDatabases({folder + "/slice1", folder + "/slice2"}, folder + "/db");
}

std::size_t cutMerges() {
    const TemporaryFolder folder;
    const std::size_t itemsOfSlice = 12;
    for (const char* slice : {"slice1", "slice2"}) {
        const std::string path = restored(folder, {});
        for (std::size_t i = 0; i < itemsOfSlice; ++i)
            folder.write(fmt::format("user/library/{} {}.wav", slice, i), "sound");
        EXPECT_TRUE(indexFolder(path));
        fs::copy_file(path + "/db", folder.path(slice));
    }
    const Files slices{{"slice1", readAll(folder.path("slice1"))},
                       {"slice2", readAll(folder.path("slice2"))}};
    return cutEveryCall(folder, slices, mergeSlices, [&](const std::string& path, Outcome outcome) {
        const bool isThere = fs::exists(path + "/db");
        EXPECT_TRUE(isThere || outcome != Outcome::succeeded);
        EXPECT_TRUE(isThere || mergeSlices(path)) << "cannot be repeated";
        EXPECT_EQ(namesIndexed(path).size(), 2 * itemsOfSlice);
        for (const auto& [name, contents] : slices) EXPECT_EQ(readAll(path + "/" + name), contents);
    });
}

/// In memory, where flushing costs nothing, on systems that keep files there.
class CrashPoints : public testing::Test {
  protected:
    static void SetUpTestSuite() {
        if (fs::is_directory("/dev/shm")) ::setenv("TMPDIR", "/dev/shm", 0);
    }
};

TEST_F(CrashPoints, OfTagWritesLoseNothing) {
    const std::size_t cuts = cutTagWrites();
    std::printf("crash points of tag writes: %zu\n", cuts);
    EXPECT_GE(cuts, 900U);
}

TEST_F(CrashPoints, OfIndexRunsLoseNothing) {
    const std::size_t cuts = cutIndexRuns();
    std::printf("crash points of index runs: %zu\n", cuts);
    EXPECT_GE(cuts, 800U);
}

TEST_F(CrashPoints, OfMergesLoseNothing) {
    const std::size_t cuts = cutMerges();
    std::printf("crash points of merges: %zu\n", cuts);
    EXPECT_GE(cuts, 350U);
}

}  // namespace
}  // namespace qvct::test
