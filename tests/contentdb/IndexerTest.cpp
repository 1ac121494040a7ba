#include "Library.h"
#include "NameDescriber.h"
#include "autotagging/ResourceFiles.h"
#include "contentdb/ContentDescriber.h"
#include "contentdb/index/WorkerMessages.h"
#include "contentdb/store/sqlite/RunLock.h"
#include "platform/base/Version.h"
#include "platform/files/ResourceBundle.h"
#include "support/CapturedLog.h"

#include <atomic>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <future>
#include <set>
#include <thread>

#include <fcntl.h>
#include <fmt/format.h>
#include <gmock/gmock.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace qvct::test {
namespace {

using namespace contentdb;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::UnorderedElementsAre;

/// A child process tells its parent how far it is, and waits there until it may go on.
class Milestone {
  public:
    Milestone() { EXPECT_EQ(::pipe(reached_) | ::pipe(passed_), 0); }
    Milestone(const Milestone&) = delete;
    Milestone& operator=(const Milestone&) = delete;
    ~Milestone() {
        for (int* end : {&reached_[0], &reached_[1], &passed_[0], &passed_[1]}) close(*end);
    }

    void reach() { EXPECT_EQ(::write(reached_[1], "!", 1), 1); }
    void awaitReached() { EXPECT_TRUE(awaitByte(reached_)); }
    void letPass() { EXPECT_EQ(::write(passed_[1], "!", 1), 1); }
    void awaitPass() {
        if (!hasPassed_) hasPassed_ = awaitByte(passed_);
    }

  private:
    /// False when the other process ends without a word.
    static bool awaitByte(int (&ends)[2]) {
        close(ends[1]);
        char byte = 0;
        return ::read(ends[0], &byte, 1) == 1;
    }
    static void close(int& end) {
        if (end >= 0) ::close(end);
        end = -1;
    }

    int reached_[2] = {};
    int passed_[2] = {};
    bool hasPassed_ = false;
};

class Indexing : public testing::Test {
  protected:
    IndexProgress index(const std::function<void(IndexOptions&)>& change = {}) {
        IndexOptions options;
        options.folders = {library()};
        options.database = database();
        options.workers = 2;
        options.note = [this](const std::string& message) { notes_.push_back(message); };
        if (change) change(options);
        Error error;
        const auto progress = options.worker.path.empty()
                                  ? indexLibrary(
                                        options, [] { return std::make_unique<NameDescriber>(); }, &error)
                                  : indexLibrary(options, &error);
        EXPECT_TRUE(progress) << error.message();
        return progress.value_or(IndexProgress{});
    }

    std::vector<std::string> names(const std::string& query = "", const std::string& path = {}) const {
        const auto database = ContentDatabase::open(path.empty() ? this->database() : path);
        std::vector<std::string> names;
        if (!database) return names;
        const auto all = database->search(*parseQuery(query, *database->vocabulary(), nullptr), 100000);
        for (const Found& found : *all) names.push_back(found.item.name);
        return names;
    }

    void write(const std::string& name, const std::string& bytes) const {
        folder_.write("library/" + name, bytes);
    }
    static void useWorkers(IndexOptions& options) { options.worker.path = QVCT_TEST_INDEX_WORKER; }
    /// Until what was written is older than a tick of the file system's clock.
    static void settle() { std::this_thread::sleep_for(std::chrono::milliseconds(40)); }
    std::string library() const { return folder_.path("library"); }
    std::string database() const { return folder_.path("db"); }

    TemporaryFolder folder_;
    std::vector<std::string> notes_;
};

TEST_F(Indexing, ReadsWhatHasChangedOnly) {
    for (const char* name : {"b/Snare.wav", "a/Kick.wav", "Pad.cst", "a/Bell.patch/tags.plist"})
        write(name, name);
    settle();
    EXPECT_EQ(index().described, 4U);
    EXPECT_THAT(names(), ElementsAre("Pad", "Bell", "Kick", "Snare"));
    IndexProgress again = index();
    EXPECT_EQ(again.described, 0U);
    EXPECT_EQ(again.unchanged, 4U);
    write("a/Kick.wav", "another sound");
    write("a/Bell.patch/tags.plist", "another record");
    write("Pad.cst.plist", "a record beside it");
    settle();
    again = index();
    EXPECT_EQ(again.described, 3U);
    EXPECT_EQ(again.unchanged, 1U);
    EXPECT_EQ(index().described, 0U);
}

TEST_F(Indexing, ReadsAnItemAgainWhenWhatLiesBesideItChanges) {
    std::string deep = "Bell.patch";  // deeper than it is looked into
    for (int i = 0; i < 20; ++i) deep += "/a";
    for (const std::string& name : std::vector<std::string>{"Kick.wav", "Kick.wav-2.wav", "Pad.cst", deep})
        write(name, "sound");
    settle();
    index();
    for (const std::string beside :
         {"Kick.wav.zxml", "Kick.wav.xml", "Kick.wav.caf", "Pad.cst.plist", "Pad.cst.zxml", "Pad.cst.caf",
          "Bell.patch.xml", "Bell.patch.caf", "Bell.patch/sub/data"}) {
        // A sound is an item of its own as well, unless its name says that it is a preview of settings.
        const bool isItem = beside.ends_with(".caf") && beside != "Pad.cst.caf";
        for (const char* bytes : {"one", "another"}) {
            write(beside, bytes);
            settle();
            EXPECT_EQ(index().described, isItem ? 2U : 1U) << beside;
        }
        std::filesystem::remove(library() + "/" + beside);
        EXPECT_EQ(index().described, 1U) << beside;
    }
    write("Kick.wav.txt", "of no account");
    write("Kick.wav.caf", "a preview");
    settle();
    index();
    EXPECT_EQ(ContentDatabase::open(database())->item(library() + "/Kick.wav")->item.stamp.size, 5U);
    EXPECT_EQ(index().described, 0U);
}

TEST_F(Indexing, ReadsAgainWhatChangedWhileItWasRead) {
    write("Kick rewritten.wav", "before");
    write("Snare vanishes.wav", "");
    settle();
    EXPECT_EQ(index().failed, 0U);
    settle();
    EXPECT_EQ(index().described, 1U);
    const auto item = ContentDatabase::open(database())->item(library() + "/Kick rewritten.wav");
    EXPECT_EQ(item->item.payloadHash, "after!");
    EXPECT_EQ(index().described, 0U);
}

TEST_F(Indexing, ReadsAgainWhatWasAwayWhileItWasRead) {
    for (const char* name : {"disk/Hat.wav", "disk/Kick.wav"}) write(name, "sound");
    settle();
    for (int run = 0; run < 2; ++run) {
        write("disk/leaves", "");
        index([run](IndexOptions& options) {
            if (run == 1) useWorkers(options);
            options.workers = 1;
        });
        std::filesystem::rename(library() + "/away", library() + "/disk");
    }
    EXPECT_EQ(index().failed, 0U);
    EXPECT_EQ(names().size(), 2U);
    const auto database = ContentDatabase::open(this->database());
    for (const char* name : {"Hat", "Kick"})
        EXPECT_EQ(database->item(library() + "/disk/" + name + ".wav")->item.payloadHash, "sound") << name;
}

TEST_F(Indexing, OfAFullDiskLosesNothingOfADamagedDatabase) {
    for (int i = 0; i < 200; ++i) {
        write(fmt::format("Kick {}.wav", i), std::to_string(i));
        folder_.write(fmt::format("elsewhere/Snare {}.wav", i), std::to_string(-i - 1));
    }
    settle();
    index([this](IndexOptions& options) { options.folders.push_back(folder_.path("elsewhere")); });
    std::string damaged = readAll(database());
    damaged[3 * 8192 + 4000] = static_cast<char>(damaged[3 * 8192 + 4000] ^ 1);
    const std::string disk = folder_.path("disk");
    std::filesystem::create_directory(disk);
    const pid_t child = ::fork();
    if (child == 0) {
        if (::unshare(CLONE_NEWNS) != 0 || ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
            ::mount("none", disk.c_str(), "tmpfs", 0, "size=4m") != 0)
            ::_exit(2);
        std::size_t refused = 0;
        for (const std::size_t pages : {0U, 25U, 50U, 75U, 100U, 140U}) {
            const std::size_t free = pages * 4096;
            for (const auto& file : std::filesystem::directory_iterator(disk)) std::filesystem::remove(file);
            std::ofstream(disk + "/db") << damaged;
            std::ofstream(disk + "/filler") << std::string((4U << 20U) - damaged.size() - free, 'x');
            IndexOptions options;
            options.folders = {library()};
            options.database = disk + "/db";
            const auto make = [] { return std::make_unique<NameDescriber>(); };
            if (!indexLibrary(options, make)) ++refused;
            std::filesystem::remove(disk + "/filler");
            EXPECT_TRUE(indexLibrary(options, make)) << free;
            EXPECT_EQ(names("", disk + "/db").size(), 400U) << free;
        }
        ::_exit(HasFailure() || refused == 0 ? 1 : 0);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    if (WEXITSTATUS(status) == 2) GTEST_SKIP() << "only root can mount a disk";
    EXPECT_EQ(status, 0);
}

TEST_F(Indexing, AndMergingTakeTurnsAtADatabase) {
    write("Kick.wav", "");
    settle();
    index();
    const std::string target = folder_.path("merged");
    const auto refusal = [&] {
        Error error;
        EXPECT_FALSE(mergeDatabases({database()}, target, &error));
        return error.message();
    };
    Milestone milestone;
    const pid_t child = ::fork();
    if (child == 0) {
        const auto turn = RunLock::acquire(target, nullptr);
        milestone.reach();
        milestone.awaitPass();
        ::_exit(0);
    }
    milestone.awaitReached();
    EXPECT_THAT(refusal(), HasSubstr("another run is writing"));
    milestone.letPass();
    ::waitpid(child, nullptr, 0);
    std::filesystem::copy_file(database(), target + ".rebuilt");
    EXPECT_THAT(refusal(), HasSubstr("exists already"));
}

TEST_F(Indexing, ReachesADatabaseThroughALink) {
    for (int i = 0; i < 300; ++i) write(fmt::format("Kick {}.wav", i), std::to_string(i));
    settle();
    const std::string link = folder_.path("link");
    std::filesystem::create_symlink("real", link);
    const auto throughLink = [&](IndexOptions& options) { options.database = link; };
    index(throughLink);
    auto turn = RunLock::acquire(folder_.path("real"), nullptr);
    IndexOptions options;
    options.folders = {library()};
    options.database = link;
    EXPECT_FALSE(indexLibrary(options, [] { return std::make_unique<NameDescriber>(); }));
    const std::string bytes = readAll(folder_.path("real"));
    folder_.write("real", bytes.substr(0, 9000) + "?" + bytes.substr(9001));
    turn.reset();
    index(throughLink);
    EXPECT_TRUE(std::filesystem::is_symlink(link));
    EXPECT_TRUE(ContentDatabase::open(folder_.path("real"))->check());
    EXPECT_EQ(names("", link).size(), 300U);
}

TEST_F(Indexing, TakesAFolderOnceThatSeveralRootsShow) {
    for (const char* name : {"Kick.wav", "sub/deep/Snare.wav", "sub/Hat.wav"}) write(name, name);
    settle();
    const auto overlapping = [this](IndexOptions& options) {
        options.folders = {library(), library() + "/sub", library()};
    };
    EXPECT_EQ(index(overlapping).described, 3U);
    write("sub/Clap.wav", "a new sound");
    settle();
    EXPECT_EQ(index(overlapping).seen, 4U);
    EXPECT_EQ(names().size(), 4U);
    EXPECT_TRUE(ContentDatabase::open(database())->check());
    std::filesystem::remove_all(library() + "/sub");
    std::filesystem::create_directory(library() + "/sub");
    const auto pruning = [&](IndexOptions& options) {
        overlapping(options);
        options.prune = true;
    };
    EXPECT_EQ(index(pruning).missing, 3U);
}

TEST_F(Indexing, KnowsAFolderAgainThatIsReachedByAnotherPath) {
    write("a/Kick.wav", "Kick");
    std::filesystem::create_directory_symlink("a", library() + "/z");
    settle();
    index([this](IndexOptions& options) { options.folders = {library() + "/z"}; });
    index([](IndexOptions& options) { options.prune = true; });
    const auto found = ContentDatabase::open(database());
    EXPECT_EQ(names().size(), 1U);
    const auto kick = found->item(library() + "/a/Kick.wav");
    ASSERT_TRUE(kick);
    EXPECT_THAT(*found->earlierPaths(kick->id), ElementsAre(library() + "/z/Kick.wav"));
}

TEST_F(Indexing, ForgetsMissingFilesOnlyWhenTold) {
    for (const char* name : {"Kick.wav", "gone/Snare.wav", "gone/deep/Hat.wav", "Clap.wav"})
        write(name, name);
    settle();
    index();
    std::filesystem::remove_all(library() + "/gone");
    std::filesystem::remove(library() + "/Clap.wav");
    EXPECT_EQ(index().pruned, 0U);
    EXPECT_EQ(names().size(), 4U);
    EXPECT_EQ(index([](IndexOptions& options) { options.prune = true; }).pruned, 3U);
    EXPECT_THAT(names(), ElementsAre("Kick"));
    EXPECT_TRUE(ContentDatabase::open(database())->check());
}

TEST_F(Indexing, ReadsAFolderThatComesBack) {
    for (const char* name : {"a/x/Kick.wav", "a/x/Snare.wav", "a/Hat.wav", "Clap.wav"}) write(name, name);
    settle();
    index();
    const auto prune = [](IndexOptions& options) { options.prune = true; };
    std::filesystem::rename(library() + "/a", library() + "/c");
    EXPECT_EQ(index().moved, 3U);
    std::filesystem::rename(library() + "/c", library() + "/a");
    EXPECT_EQ(index().moved, 3U);
    EXPECT_EQ(index(prune).pruned, 0U);
    EXPECT_EQ(names("path:\"/a/\"").size(), 3U);
    std::filesystem::rename(library() + "/a", folder_.path("away"));
    EXPECT_EQ(index(prune).pruned, 3U);
    std::filesystem::rename(folder_.path("away"), library() + "/a");
    EXPECT_EQ(index().described, 3U);
    EXPECT_EQ(names().size(), 4U);
}

TEST_F(Indexing, TakesNothingOutWhileADiskMayBeAway) {
    const std::string disk = folder_.path("disk");
    const std::string mounted = folder_.path("mounted");
    for (const char* name : {"Kick.wav", "a/Snare.wav"}) folder_.write(std::string("disk/") + name, name);
    write("Hat.wav", "Hat");
    std::filesystem::create_directory_symlink(mounted, library() + "/link");
    folder_.write("mounted/Clap.wav", "Clap");
    settle();
    std::vector<std::string> failures;
    const auto prunedWith = [&](bool roots) {
        failures.clear();
        return index([&](IndexOptions& options) {
                   options.folders = {library(), disk};
                   options.links.outside = LinksOutside::all;
                   options.prune = true;
                   options.pruneRoots = roots;
                   options.failed = [&](const Error& error) { failures.push_back(error.message()); };
               })
            .pruned;
    };
    EXPECT_EQ(prunedWith(false), 0U);
    EXPECT_EQ(names().size(), 4U);
    for (const std::string& place : {disk, mounted}) std::filesystem::rename(place, place + " away");
    std::filesystem::create_directory(disk);
    EXPECT_EQ(prunedWith(false), 0U);
    EXPECT_THAT(failures,
                ElementsAre(HasSubstr(disk + ": nothing is left in it, as when a disk is away; its 2 items "
                                             "stay in the database unless roots are pruned")));
    std::filesystem::remove(disk);
    EXPECT_EQ(prunedWith(true), 2U);
    EXPECT_THAT(names(), UnorderedElementsAre("Hat", "Clap"));
    for (const std::string& place : {disk, mounted}) std::filesystem::rename(place + " away", place);
    EXPECT_EQ(prunedWith(false), 0U);
    EXPECT_EQ(names().size(), 4U);
    EXPECT_THAT(failures, testing::IsEmpty());
}

TEST_F(Indexing, KnowsAMovedFileAgain) {
    for (const char* name : {"a/Kick.wav", "a/Snare.wav"}) write(name, name);
    settle();
    index();
    const ItemId before = ContentDatabase::open(database())->item(library() + "/a/Kick.wav")->id;
    std::filesystem::create_directory(library() + "/z");
    std::filesystem::rename(library() + "/a/Kick.wav", library() + "/z/Renamed.wav");
    settle();
    EXPECT_EQ(index([](IndexOptions& options) { options.prune = true; }).moved, 1U);
    const auto database = ContentDatabase::open(this->database());
    const auto found = database->item(library() + "/z/Renamed.wav");
    ASSERT_TRUE(found);
    EXPECT_EQ(found->id, before);
    EXPECT_THAT(*database->earlierPaths(before), ElementsAre(library() + "/a/Kick.wav"));
    EXPECT_THAT(names(), UnorderedElementsAre("Renamed", "Snare"));
    EXPECT_TRUE(database->check());
}

TEST_F(Indexing, MissesWhatIsGoneButNotWhatWasMoved) {
    for (const char* name : {"a/Kick.wav", "a/Snare.wav", "a/Hat.wav", "z/Clap.wav", "z/Tom.wav"})
        write(name, name);
    settle();
    index();
    std::filesystem::rename(library() + "/a/Kick.wav", library() + "/z/Kick.wav");
    std::filesystem::rename(library() + "/z/Clap.wav", library() + "/a/Clap.wav");
    std::filesystem::remove(library() + "/a/Hat.wav");
    settle();
    for (const std::uint64_t moved : {2U, 0U, 0U}) {
        const IndexProgress progress = index();
        EXPECT_EQ(progress.moved, moved);
        EXPECT_EQ(progress.missing, 1U);
    }
    // Found again when it was missing already.
    write("z/Hat.wav", "a/Hat.wav");
    settle();
    for (const std::uint64_t moved : {1U, 0U}) {
        const IndexProgress progress = index();
        EXPECT_EQ(progress.moved, moved);
        EXPECT_EQ(progress.missing, 0U);
    }
}

TEST_F(Indexing, KnowsAMovedFileAmongManyCopies) {
    for (int i = 0; i < 60; ++i) write(fmt::format("{}/Kick.wav", i), "the same");
    settle();
    index();
    const ItemId before = ContentDatabase::open(database())->item(library() + "/57/Kick.wav")->id;
    std::filesystem::rename(library() + "/57", library() + "/moved");
    settle();
    EXPECT_EQ(index().moved, 1U);
    EXPECT_EQ(ContentDatabase::open(database())->item(library() + "/moved/Kick.wav")->id, before);
    write("copied/Kick.wav", "the same");
    settle();
    EXPECT_EQ(index().moved, 0U);
}

TEST_F(Indexing, TakesNothingForMovedThatOnlyCannotBeLookedAt) {
    write("a/Kick.wav", "Kick");
    settle();
    index();
    std::filesystem::rename(library() + "/a", folder_.path("aside"));
    std::filesystem::create_symlink("a", library() + "/a");
    write("z/Kick.wav", "Kick");
    settle();
    const IndexProgress progress = index([](IndexOptions& options) { options.prune = true; });
    EXPECT_EQ(progress.moved + progress.pruned, 0U);
    EXPECT_EQ(names().size(), 2U);
}

TEST_F(Indexing, LosesOneItemToEachThatFailsCrashesOrHangs) {
    std::vector<std::string> good;
    for (int i = 0; i < 300; ++i) {
        good.push_back("Kick" + std::to_string(i));
        write(good.back() + ".wav", "");
    }
    for (const char* name : {"A fails.wav", "B crashes.wav", "C fails beside.wav", "Kick15 exits.wav",
                             "L hangs.wav", "M throws.wav", "N is silent.wav", "N mumbles.wav"})
        write(name, "");
    write("O.wav", std::string(17U << 20U, 'x'));
    settle();
    const auto limit = [](IndexOptions& options) {
        useWorkers(options);
        options.timeLimitPerItem = std::chrono::milliseconds(1500);
        options.retryFailed = true;
    };
    const IndexProgress progress = index(limit);
    EXPECT_EQ(progress.described, 300U);
    EXPECT_EQ(progress.failed, 9U);
    EXPECT_THAT(names(), testing::UnorderedElementsAreArray(good));
    std::vector<std::string> reasons;
    ContentDatabase::open(database())->forEachFailure([&](const IndexedItem& item) {
        reasons.push_back(URL::fileURLWithPath(item.path).lastPathComponent() + ": " + item.failure);
        return true;
    });
    EXPECT_THAT(reasons, ElementsAre("A fails.wav: it is broken",
                                     HasSubstr("B crashes.wav: reading it crashed (Segmentation fault"),
                                     "C fails beside.wav: C fails beside.wav.plist: it is broken",
                                     HasSubstr("Kick15 exits.wav: reading it ended the process (status 3)"),
                                     "L hangs.wav: reading it took longer than 1.5 s",
                                     "M throws.wav: out of luck", "N is silent.wav: no description",
                                     "N mumbles.wav: the describer failed and does not say why",
                                     HasSubstr("O.wav: its description takes 178")));
    EXPECT_EQ(index(useWorkers).failed, 0U);
    EXPECT_EQ(index(limit).failed, 9U);
}

TEST_F(Indexing, HearsWhatItsWorkersLogAndLeavesThemNoFile) {
    for (const char* name : {"A logs.wav", "B logs and crashes.wav", "C tells.wav", "D throws.wav"})
        write(name, name);
    settle();
    const CapturedLog log;
    const int left = ::open(library().c_str(), O_RDONLY);
    const std::string note = folder_.path("note");
    ::setenv("QVCT_TEST_NOTE", note.c_str(), 1);
    ResourceBundle::setDirectory("/resources");
    std::string open;
    const IndexProgress progress = index([&open](IndexOptions& options) {
        useWorkers(options);
        options.isCancelled = [&open] {
            open += NameDescriber::openFiles();
            return false;
        };
    });
    ::unsetenv("QVCT_TEST_NOTE");
    ResourceBundle::setDirectory({});
    ::close(left);
    EXPECT_EQ(progress.described, 2U);
    EXPECT_THAT(open, testing::AllOf(HasSubstr("socket:"), testing::Not(HasSubstr("memfd:"))));
    EXPECT_EQ(readAll(note), "over;over;");  // they went by themselves, and their host's log is its own again
    EXPECT_THAT(log.messages(), UnorderedElementsAre("about A logs", "about B logs and crashes"));
    const auto item = ContentDatabase::open(database())->item(library() + "/C tells.wav");
    EXPECT_EQ(item->item.title, "/dev/nu /dev/nu socket: ");
    EXPECT_THAT(item->item.packs, ElementsAre("/resources"));
    // In threads of the host the same is described, and fails, but for what crashes it.
    std::filesystem::remove(library() + "/B logs and crashes.wav");
    const IndexProgress again = index([](IndexOptions& options) { options.describer = 2; });
    EXPECT_EQ(again.described + again.failed, 3U);
}

TEST_F(Indexing, SaysWhyNothingDescribes) {
    write("Kick.wav", "");
    settle();
    IndexOptions options;
    options.folders = {library()};
    options.database = database();
    const auto problem = [&options](const WorkerProgram& program) {
        options.worker = program;
        Error error;
        EXPECT_FALSE(indexLibrary(options, &error));
        return error.message();
    };
    const std::string missing = folder_.path("none");
    EXPECT_EQ(problem({missing, {}}), missing + ": cannot be started: No such file or directory");
    EXPECT_EQ(problem({"worker", {}}), "worker: is not an absolute path");
    EXPECT_THAT(problem({}), HasSubstr("/qvcontenttagging/qvct-index-worker: cannot be started"));
    const std::string greeting = fmt::format(R"(printf '\{:o}\0\0\0\0\{:03o}{}' >&0; read -r line)",
                                             version().size() + 2, version().size(), version());
    const std::string barren = " before it described anything, 6 times in a row";
    const std::pair<std::string, std::string> scripts[] = {
        {"exit 1", "ended the process (status 1)" + barren},
        {R"(printf '\7\0\0\0\0\0050.0.9' >&0; read -r line)",
         fmt::format("is of version \"0.0.9\", and \"{}\" is needed", workerEdition())},
        {greeting, fmt::format("is of version \"{}\", and \"{}\" is needed", version(), workerEdition())},
        {R"(printf '\1\0\0\0\11' >&0; read -r line)", "sent an answer that makes no sense" + barren},
        {R"(printf '\0\0\0\177' >&0; read -r line)", "sent an answer that is too long" + barren},
        {R"(printf '\0\0\0\0' >&0; read -r line)", "sent an answer that makes no sense" + barren},
        // Takes away the memory that both see.
        {"(: >/proc/self/fd/1) 2>/dev/null; exit 1", "ended the process (status 1)" + barren}};
    for (const auto& [script, reason] : scripts)
        EXPECT_EQ(problem({"/bin/sh", {"-c", script}}), "/bin/sh: " + reason);
    const auto problemOf = [&options](const DescriberFactory& factory) {
        Error error;
        EXPECT_FALSE(indexLibrary(options, factory, &error));
        return error.message();
    };
    using Made = std::unique_ptr<ItemDescriber>;
    const std::string silent = "the describer failed and does not say why";
    EXPECT_EQ(problemOf(nullptr), "there is nothing that describes items");
    EXPECT_EQ(problemOf([] { return Made(); }), "there is nothing that describes items");
    EXPECT_EQ(problemOf([]() -> Made { throw std::runtime_error("out of luck"); }), "out of luck");
    EXPECT_EQ(problemOf([]() -> Made { throw std::runtime_error(""); }), silent);
    EXPECT_EQ(problemOf([]() -> Made { throw 1; }), silent);
    EXPECT_EQ(index().described, 1U);
}

TEST_F(Indexing, KeepsWhatWasDescribedBeforeAProblem) {
    for (int i = 0; i < 10; ++i) write(fmt::format("Kick {}.wav", i), "");
    settle();
    IndexOptions options;
    options.folders = {library()};
    options.database = database();
    options.workers = 2;
    // After the first item, and before the run listens again, one thread describes the rest and the other
    // fails.
    static std::atomic<int> described;
    static std::atomic<bool> isAway;
    described = 0;
    isAway = false;
    struct PausingDescriber : NameDescriber {
        std::optional<IndexedItem> describe(const std::string& path, Error* error) override {
            while (described > 0 && !isAway) std::this_thread::yield();
            auto item = NameDescriber::describe(path, error);
            ++described;
            return item;
        }
    };
    const auto untilAllAreDescribed = [](int milliseconds) {
        while (described < 10) std::this_thread::yield();
        std::this_thread::sleep_for(std::chrono::milliseconds(milliseconds));
    };
    options.isCancelled = [&untilAllAreDescribed] {
        if (described == 0) return false;
        isAway = true;
        untilAllAreDescribed(100);
        return false;
    };
    std::atomic<int> made = 0;
    const auto factory = [&]() -> std::unique_ptr<NameDescriber> {
        if (made++ == 0) return std::make_unique<PausingDescriber>();
        untilAllAreDescribed(30);
        throw std::runtime_error("out of luck");
    };
    EXPECT_FALSE(indexLibrary(options, factory));
    EXPECT_EQ(names().size(), 10U);
}

TEST_F(Indexing, HearsOfSlowItemsBeforeAllAreDone) {
    constexpr std::uint64_t count = 120;  // fewer than a worker's queue holds
    for (std::uint64_t i = 0; i < count; ++i) write(fmt::format("slow {}.wav", i), "");
    settle();
    std::set<std::uint64_t> described;
    index([&described](IndexOptions& options) {
        useWorkers(options);
        options.workers = 1;
        options.longestBatch = std::chrono::milliseconds(0);
        options.progress = [&described](const IndexProgress& at) { described.insert(at.described); };
    });
    EXPECT_THAT(described, Contains(testing::AllOf(testing::Gt(0U), testing::Lt(count))));
}

TEST_F(Indexing, GivesWorkToThreadsThatHadNone) {
    for (int i = 0; i < 200; ++i) write(fmt::format("Kick {}.wav", i), "");  // more than a queue holds
    const IndexProgress progress = index([](IndexOptions& options) {
        options.workers = 1;
        options.isCancelled = [] {
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
            return false;
        };
    });
    EXPECT_EQ(progress.described, 200U);
}

TEST_F(Indexing, StopsWhenToldAmongTheItemsOfAFolder) {
    for (int i = 0; i < 400; ++i) write(fmt::format("Kick {}.wav", i), "");  // more than two queues hold
    const IndexProgress progress = index([](IndexOptions& options) {
        options.workers = 1;
        options.isCancelled = [] { return true; };
    });
    EXPECT_LE(progress.described, 128U) << "more than were on their way";
}

TEST_F(Indexing, HasEachItemDescribedOnce) {
    constexpr std::size_t count = 500;  // several queues full
    for (std::size_t i = 0; i < count; ++i) write(fmt::format("logs {}.wav", i), "");
    settle();
    const CapturedLog log;
    index([](IndexOptions& options) {
        useWorkers(options);
        options.workers = 1;
    });
    EXPECT_EQ(log.messages().size(), count);
}

TEST_F(Indexing, IsPatientWithAWorkerThatWaitsForIt) {
    write("Kick shouts.wav", "");
    settle();
    const CapturedLog log;
    const IndexProgress progress = index([](IndexOptions& options) {
        useWorkers(options);
        options.timeLimitPerItem = std::chrono::milliseconds(300);
        options.isCancelled = [] {
            std::this_thread::sleep_for(std::chrono::milliseconds(500));
            return false;
        };
    });
    EXPECT_EQ(progress.described, 1U);
    EXPECT_EQ(log.messages().size(), 1U);
}

TEST_F(Indexing, GoesOnThoughItIsNotKnownHowAWorkerEnded) {
    write("Kick.wav", "");
    write("A crashes.wav", "");
    settle();
    const auto failures = [this] {
        index(useWorkers);
        std::vector<std::string> reasons;
        ContentDatabase::open(database())->forEachFailure([&](const IndexedItem& item) {
            reasons.push_back(item.failure);
            return true;
        });
        return reasons;
    };
    const auto isUnknown = HasSubstr("it is not known how");
    const auto handler = ::signal(SIGCHLD, SIG_IGN);
    EXPECT_THAT(failures(), ElementsAre(isUnknown));
    ::signal(SIGCHLD, handler);
    // This one stays when it has ended.
    write("Hat is held and exits.wav", "");
    settle();
    const auto begin = std::chrono::steady_clock::now();
    EXPECT_EQ(failures().size(), 2U);
    EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::seconds(15));
    EXPECT_THAT(names(), ElementsAre("Kick"));
}

TEST_F(Indexing, IsDescribedByOurWorkersAsInThisProcess) {
    write("Zorp Kick.wav", "no sound");
    write("Zorp Pad.cst", "settings");
    const std::string mapping = folder_.write(
        "Words.plist", R"(<plist version="1.0"><dict><key>Zorp</key><string>House</string></dict></plist>)");
    const std::string broken = folder_.write("Rules.plist", "no rules");
    settle();
    ResourceBundle::setPathForResource("DefaultKeywordMapping", "plist", mapping);
    ResourceBundle::setPathForResource("DefaultRules", "plist", broken);
    const CapturedLog log;
    IndexOptions options;
    options.folders = {library()};
    options.workers = 2;
    options.services = QVCTAutoTaggingOptionFilenameKeywords;
    options.database = folder_.path("threads");
    Error error;
    EXPECT_TRUE(indexLibrary(
        options, [&] { return std::make_unique<ContentDescriber>(options.services); }, &error))
        << error.message();
    options.database = folder_.path("workers");
    ::setenv("QVCT_INDEX_WORKER", QVCT_INDEX_WORKER, 1);
    EXPECT_TRUE(indexLibrary(options, &error)) << error.message();
    ::unsetenv("QVCT_INDEX_WORKER");
    for (const ResourceFile& resource : resourceFiles())
        ResourceBundle::setPathForResource(resource.name, resource.extension, std::nullopt);
    const std::string path = library() + "/Zorp Pad.cst";
    const auto item = ContentDatabase::open(options.database)->item(path)->item;
    EXPECT_EQ(item, ContentDatabase::open(folder_.path("threads"))->item(path)->item);
    EXPECT_THAT(item.taggings, Contains(testing::Field(&IndexedTagging::label, "House")));
    EXPECT_THAT(log.messages(), ElementsAre(HasSubstr(broken + ": ")));
}

TEST_F(Indexing, AWorkerThatIsStartedByHandSaysThatItDoesNothing) {
    const std::string said = folder_.path("said");
    const std::string command = std::string(QVCT_INDEX_WORKER) + " </dev/null 2>'" + said + "'";
    EXPECT_NE(std::system(command.c_str()), 0);
    EXPECT_THAT(test::readAll(said), HasSubstr("does nothing by itself"));
}

TEST_F(Indexing, GoesOnWhereItWasKilled) {
    constexpr std::size_t enough = 250;
    for (int i = 0; i < 2500; ++i) write(fmt::format("{}/slow {}.wav", i % 7, i), std::to_string(i));
    settle();
    std::size_t stored = 0;
    for (int attempt = 1; attempt <= 3; ++attempt) {
        Milestone milestone;
        const pid_t child = ::fork();
        if (child == 0) {
            index([&](IndexOptions& options) {
                useWorkers(options);
                options.longestBatch = std::chrono::milliseconds(10);
                options.progress = [&](const IndexProgress& at) {
                    if (at.described >= enough) milestone.reach();
                };
            });
            ::_exit(0);
        }
        milestone.awaitReached();
        std::this_thread::sleep_for(std::chrono::milliseconds(7 * attempt));  // to wherever it is then
        ::kill(child, SIGKILL);
        ::waitpid(child, nullptr, 0);
        const std::size_t now = names().size();
        EXPECT_GE(now, stored + enough);
        stored = now;
    }
    const IndexProgress last = index();
    EXPECT_EQ(last.unchanged, stored);
    EXPECT_EQ(last.described, 2500 - stored);
    EXPECT_EQ(names().size(), 2500U);
    EXPECT_TRUE(ContentDatabase::open(database())->check());
}

TEST_F(Indexing, TakesItsWorkersWithItWhenItIsKilled) {
    write("noted and hangs.wav", "");
    settle();
    const pid_t child = ::fork();
    if (child == 0) {
        index(useWorkers);
        ::_exit(0);
    }
    std::string worker;
    while (worker.empty()) worker = readAll(library() + "/noted and hangs.wav");
    ::kill(child, SIGKILL);
    ::waitpid(child, nullptr, 0);
    // Gone, or waiting for whoever inherits it to ask how it ended.
    const auto isGone = [&worker] {
        const std::string status = readAll("/proc/" + worker + "/stat");
        return status.empty() || status.find(") Z ") != std::string::npos;
    };
    for (int i = 0; i < 500 && !isGone(); ++i) std::this_thread::sleep_for(std::chrono::milliseconds(10));
    EXPECT_TRUE(isGone());
    if (!isGone()) ::kill(std::stoi(worker), SIGKILL);
}

TEST_F(Indexing, StopsWhenToldThoughNothingIsNew) {
    for (const char* name : {"Kick 0.wav", "Kick 1.wav", "Kick 2.wav", "Snare.wav", "a/Hat.wav"})
        write(name, name);
    settle();
    index();
    for (unsigned folders = 0; folders <= 2; ++folders) {
        std::filesystem::remove(fmt::format("{}/Kick {}.wav", library(), folders));
        const IndexProgress progress = index([folders](IndexOptions& options) {
            options.prune = true;
            options.isCancelled = [folders, asked = 0U]() mutable { return asked++ >= folders; };
        });
        EXPECT_EQ(progress.seen, 3 - folders + (folders == 0 ? 0 : 1)) << folders;
        EXPECT_EQ(progress.pruned, 0U) << folders;
    }
    EXPECT_EQ(names().size(), 5U);
}

TEST_F(Indexing, ReadsAgainWhatAnotherDescriberDescribed) {
    constexpr std::uint64_t count = 1000;
    for (std::uint64_t i = 0; i < count; ++i) write(fmt::format("Kick {}.wav", i), std::to_string(i));
    write("elsewhere/Kick.wav", "");
    write("Kick 2 fails.wav", "");  // after more than a hundred, before more than the workers' queues hold
    settle();
    index();
    // A database of the first form, which did not keep who described.
    Connection(database(), Connection::Mode::readWrite)
        .run(
            "DROP TABLE likeness; DROP TABLE setting; ALTER TABLE folder DROP COLUMN part; ALTER TABLE "
            "folder DROP COLUMN parts;"
            "PRAGMA user_version = 1");
    const auto second = [](IndexOptions& options) { options.describer = 2; };
    bool hasFailed = false;
    const IndexProgress interrupted = index([&](IndexOptions& options) {
        options.describer = 2;
        options.longestBatch = std::chrono::milliseconds(0);
        options.failed = [&](const Error&) { hasFailed = true; };
        options.isCancelled = [&] { return hasFailed; };
    });
    EXPECT_GT(interrupted.described, 0U);
    EXPECT_LT(interrupted.described, count);
    EXPECT_EQ(index(second).described, count + 1 - interrupted.described);
    EXPECT_EQ(index(second).described, 0U);
    EXPECT_EQ(index().described, count + 1);
    EXPECT_EQ(names().size(), count + 1);
}

TEST_F(Indexing, OfPartsUnitesToTheSameContent) {
    for (int i = 0; i < 500; ++i) write(fmt::format("{}/{}/Kick {}.wav", i % 5, i % 3, i), std::to_string(i));
    write("2/A fails.wav", "");
    settle();
    index();
    std::vector<std::string> parts;
    std::size_t sum = 0;
    for (unsigned part = 1; part <= 3; ++part) {
        parts.push_back(folder_.path("part" + std::to_string(part)));
        sum += index([&](IndexOptions& options) {
                   options.database = parts.back();
                   options.describer = 2;
                   options.part = part;
                   options.parts = 3;
               }).described;
    }
    EXPECT_EQ(sum, 500U);
    const std::string merged = folder_.path("merged");
    Error error;
    ASSERT_TRUE(mergeDatabases({parts[2], parts[0], parts[1]}, merged, &error)) << error.message();
    EXPECT_EQ(names("", merged), names());
    EXPECT_EQ(names("name-", merged), names("name-"));
    const auto whole = ContentDatabase::open(database());
    const auto united = ContentDatabase::open(merged);
    EXPECT_TRUE(united->check(&error)) << error.message();
    EXPECT_EQ(united->totals()->failures, 1);
    const IndexProgress again = index([&merged](IndexOptions& options) {
        options.database = merged;
        options.describer = 2;
    });
    EXPECT_EQ(again.unchanged, 501U);
    const auto all = whole->search(*parseQuery("", {}, nullptr), 1000);
    for (const Found& found : *all) EXPECT_EQ(united->item(found.item.path)->item, found.item);
    EXPECT_FALSE(mergeDatabases(parts, merged, &error));
    EXPECT_THAT(error.message(), HasSubstr("exists already"));
}

TEST_F(Indexing, OfPartsInOneDatabaseMissesNothingOfTheOthers) {
    for (int i = 0; i < 40; ++i) write(fmt::format("Kick {}.wav", i), std::to_string(i));
    settle();
    const auto part = [this](unsigned number) {
        return index([number](IndexOptions& options) {
            options.prune = true;
            options.part = number;
            options.parts = 2;
        });
    };
    EXPECT_EQ(part(1).missing + part(2).missing + part(1).missing, 0U);
    std::filesystem::remove(library() + "/Kick 7.wav");
    EXPECT_EQ(part(1).pruned + part(2).pruned, 1U);
    EXPECT_EQ(names().size(), 39U);
}

TEST_F(Indexing, OfAPartHidesNothingMissingFromOtherRuns) {
    const auto run = [this](unsigned part) {
        return index([part](IndexOptions& options) {
            options.prune = true;
            options.pruneRoots = true;
            options.part = std::max(part, 1U);
            options.parts = part == 0 ? 1 : 2;
        });
    };
    for (const unsigned next : {0U, 2U}) {
        for (int i = 0; i < 40; ++i) write(fmt::format("{}/Kick {}.wav", next, i), std::to_string(i));
        settle();
        run(0);
        std::filesystem::remove_all(fmt::format("{}/{}", library(), next));
        std::filesystem::create_directory(fmt::format("{}/{}", library(), next));
        const std::uint64_t pruned = run(1).pruned;
        EXPECT_GT(pruned, 0U);
        EXPECT_LT(pruned, 40U);
        EXPECT_EQ(run(1).missing, 0U);
        EXPECT_EQ(run(next).pruned, 40 - pruned);
        EXPECT_THAT(names(), testing::IsEmpty());
    }
    // What only the other part lacks.
    for (int i = 0; i < 6; ++i) write(fmt::format("Kick {}.wav", i), std::to_string(i));
    settle();
    run(0);
    const std::string other = folder_.path("only");
    index([&other](IndexOptions& options) {
        options.database = other;
        options.part = 2;
        options.parts = 2;
    });
    const std::vector<std::string> ofOther = names("", other);
    ASSERT_FALSE(ofOther.empty());
    for (const std::string& name : ofOther) std::filesystem::remove(library() + "/" + name + ".wav");
    EXPECT_EQ(run(1).missing, 0U);
    EXPECT_EQ(run(0).pruned, ofOther.size());
}

TEST_F(Indexing, RebuildsADamagedDatabaseAndKeepsTheOld) {
    for (int i = 0; i < 300; ++i) write(fmt::format("Kick {}.wav", i), "");
    settle();
    index();
    constexpr auto isPrivate = std::filesystem::perms(0600);
    std::filesystem::permissions(database(), isPrivate);
    std::string bytes = readAll(database());
    for (std::size_t at = 9000; at < bytes.size(); at += 8192) bytes[at] = static_cast<char>(bytes[at] ^ 1);
    folder_.write("db", bytes);
    EXPECT_EQ(index().described, 300U);
    EXPECT_EQ(names().size(), 300U);
    EXPECT_THAT(notes_, ElementsAre(HasSubstr("built anew")));
    EXPECT_EQ(readAll(database() + ".damaged"), bytes);
    EXPECT_EQ(std::filesystem::status(database()).permissions(), isPrivate);
    // Interrupted before the new one was in its place: a reader puts it there, and so does a run.
    for (const bool isAside : {true, false}) {
        for (const bool byReader : {true, false}) {
            std::filesystem::rename(database(), database() + ".rebuilt");
            if (!isAside) folder_.write("db", bytes);
            EXPECT_EQ(byReader ? names().size() : index().unchanged, 300U);
            EXPECT_EQ(names().size(), 300U);
            EXPECT_FALSE(fileExists(database() + ".rebuilt"));
            if (!byReader) {
                EXPECT_THAT(notes_.back(), testing::EndsWith(isAside ? "db.damaged" : "db.damaged-3"));
            }
        }
    }
    EXPECT_EQ(readAll(database() + ".damaged-3"), bytes);
}

TEST_F(Indexing, IsWaitedForWhileTheDatabaseIsMade) {
    for (int i = 0; i < 20; ++i) write(fmt::format("Kick {}.wav", i), std::to_string(i));
    Milestone milestone;
    const pid_t child = ::fork();
    if (child == 0) {
        index([&](IndexOptions& theirs) {
            theirs.isCancelled = [&] {
                milestone.reach();
                milestone.awaitPass();
                return false;
            };
        });
        ::_exit(0);
    }
    milestone.awaitReached();
    auto found = std::async(std::launch::async, [this] { return names("kick"); });
    EXPECT_EQ(found.wait_for(std::chrono::milliseconds(200)), std::future_status::timeout);
    milestone.letPass();
    EXPECT_EQ(found.get().size(), 20U);
    ::waitpid(child, nullptr, 0);
    EXPECT_FALSE(ContentDatabase::open(database())->isBeingIndexed());
}

TEST_F(Indexing, IsNotSearchedByAnExpressionWithoutEnd) {
    write(std::string(40, 'a') + "!.wav", "");
    settle();
    index();
    const auto database = ContentDatabase::open(this->database());
    const auto query = parseQuery("-name::^(a+)+$", *database->vocabulary(), nullptr);
    Error error;
    EXPECT_FALSE(database->search(*query, 10, &error));
    EXPECT_THAT(error.message(), HasSubstr("regular expression \"^(a+)+$\" on \"aaaa"));
    EXPECT_THAT(error.message(), HasSubstr("takes too long"));
}

TEST_F(Indexing, FindsDamageOnAnyPageAndKeepsAllFolders) {
    for (int i = 0; i < 150; ++i) {
        write(fmt::format("{}/Kick {}.wav", i % 3, i), std::to_string(i));
        folder_.write(fmt::format("elsewhere/{}/Snare {}.wav", i % 3, i), std::to_string(-i - 1));
    }
    write("Hat.wav", "hat");
    std::filesystem::create_directory_symlink(folder_.path("elsewhere/2"), library() + "/link");
    settle();
    index([this](IndexOptions& options) {
        options.folders = {folder_.path("elsewhere/0"), folder_.path("elsewhere/1"), library()};
        options.links.outside = LinksOutside::all;
    });
    std::filesystem::rename(library() + "/0/Kick 0.wav", library() + "/1/Moved.wav");
    settle();
    EXPECT_EQ(index().moved, 1U);
    const std::string intact = readAll(database());
    const std::vector<std::string> all = names();
    const std::size_t pages = intact.size() / 8192;
    ASSERT_GT(pages, 15U);
    std::size_t withHistory = 0, withItems = 0;
    for (std::size_t page = 1; page < pages; ++page) {
        std::string bytes = intact;
        bytes[page * 8192 + 4000] = static_cast<char>(bytes[page * 8192 + 4000] ^ 1);
        folder_.write("db", bytes);
        notes_.clear();
        const IndexProgress progress = index([](IndexOptions& options) { options.prune = true; });
        EXPECT_THAT(notes_, ElementsAre(HasSubstr("built anew, with"))) << page;
        withItems += notes_.back().find(", with 0 items") == std::string::npos ? 1U : 0U;
        EXPECT_LT(progress.described, 150U) << page;
        EXPECT_THAT(names(), testing::UnorderedElementsAreArray(all)) << page;
        const auto rebuilt = ContentDatabase::open(database());
        EXPECT_TRUE(rebuilt->check()) << page;
        withHistory += rebuilt->earlierPaths(rebuilt->item(library() + "/1/Moved.wav")->id)->size();
    }
    EXPECT_GT(withHistory, pages - 6);
    EXPECT_GT(withItems, pages - 6);
    // The first page says what all others are.
    folder_.write("db", intact.substr(0, 4000) + "?" + intact.substr(4001));
    notes_.clear();
    index();
    EXPECT_THAT(notes_, ElementsAre(HasSubstr("which other folders were in it could not be read")));
    EXPECT_EQ(names("kick,moved").size(), 150U);
}

TEST_F(Indexing, ReadsTheDatabaseWholeWhenTold) {
    for (int i = 0; i < 20; ++i) write(fmt::format("Kick {}.wav", i), std::to_string(i));
    settle();
    index();
    // Nothing that a checksum would tell.
    const std::pair<const char*, std::string> cases[] = {
        {"DELETE FROM posting WHERE key % 7 = 3", "the index does not say what the items say"},
        {"DELETE FROM term WHERE id = (SELECT max(id) FROM term)", "is missing"},
        {"UPDATE posting SET ids = x'00' WHERE key = (SELECT max(key) FROM posting)", "an index entry"},
        {"UPDATE item SET description = x'05' WHERE id = 3", "the record of " + library() + "/Kick 10.wav"},
        {"UPDATE folder SET digest = digest + 1",
         library() + " does not hold the items that it is known by"}};
    for (const auto& [fault, reason] : cases) {
        Connection(database(), Connection::Mode::readWrite).run(fault);
        Error error;
        EXPECT_FALSE(ContentDatabase::open(database())->check(&error));
        EXPECT_THAT(error.message(), HasSubstr(reason + "; indexing it with `check` builds it anew"));
        notes_.clear();
        index([](IndexOptions& options) { options.check = true; });
        EXPECT_THAT(notes_, ElementsAre(HasSubstr("built anew")));
        EXPECT_TRUE(ContentDatabase::open(database())->check());
        EXPECT_EQ(names("kick").size(), 20U);
    }
}

TEST_F(Indexing, RefusesASecondRunAForeignFileAndAMissingFolder) {
    write("Kick.wav", "");
    const std::string song = folder_.write("song.wav", std::string(20000, 'x'));
    IndexOptions options;
    options.folders = {library()};
    options.database = song;
    const auto refusal = [&options] {
        Error error;
        EXPECT_FALSE(indexLibrary(
            options, [] { return std::make_unique<NameDescriber>(); }, &error));
        return error.message();
    };
    EXPECT_THAT(refusal(), HasSubstr("not a content database"));
    EXPECT_EQ(readAll(song), std::string(20000, 'x'));
    options.database = folder_.path("pipe");
    ASSERT_EQ(::mkfifo(options.database.c_str(), 0600), 0);
    EXPECT_THAT(refusal(), HasSubstr("a pipe or device"));
    EXPECT_FALSE(fileExists(options.database + "-lock"));
    options.database = folder_.path("none/db");
    EXPECT_THAT(refusal(), HasSubstr("cannot be written"));
    options.database = database();
    options.folders = {folder_.path("none")};
    EXPECT_THAT(refusal(), HasSubstr("no such folder"));
    // Another process has the lock: in this one it would be the same holder.
    options.folders = {library()};
    Milestone milestone;
    const pid_t child = ::fork();
    if (child == 0) {
        index([&](IndexOptions& theirs) {
            theirs.progress = [&](const IndexProgress&) {
                milestone.reach();
                milestone.awaitPass();
            };
        });
        ::_exit(0);
    }
    milestone.awaitReached();
    EXPECT_THAT(refusal(), HasSubstr(fmt::format("another run is writing to it (process {})", child)));
    milestone.letPass();
    ::waitpid(child, nullptr, 0);
    ASSERT_EQ(::mkfifo((database() + ".rebuilt").c_str(), 0600), 0);
    EXPECT_THAT(names(), ElementsAre("Kick"));
}

TEST_F(Indexing, KeepsWhatItHasWhenTheDiskIsFull) {
    for (int i = 0; i < 300; ++i) write(fmt::format("Kick {}.wav", i), std::to_string(i));
    settle();
    index();
    for (int i = 0; i < 3000; ++i) write(fmt::format("more/{}/Snare {}.wav", i % 9, i), std::to_string(i));
    settle();
    const pid_t child = ::fork();
    if (child == 0) {
        // Stands for a full disk: no file may grow beyond this.
        ::signal(SIGXFSZ, SIG_IGN);
        const rlimit limit = {600000, 600000};
        ::setrlimit(RLIMIT_FSIZE, &limit);
        IndexOptions options;
        options.folders = {library()};
        options.database = database();
        Error error;
        const auto progress = indexLibrary(
            options, [] { return std::make_unique<NameDescriber>(); }, &error);
        EXPECT_EQ(error.message(), database() + ": disk I/O error");
        ::_exit(!progress && !HasFailure() ? 7 : 0);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    EXPECT_EQ(WEXITSTATUS(status), 7);
    EXPECT_GE(names().size(), 300U);
    EXPECT_TRUE(ContentDatabase::open(database())->check());
    index();
    EXPECT_EQ(names().size(), 3300U);
}

TEST_F(Indexing, TakesAnyNameAndCirclesOfLinks) {
    const std::vector<std::string> odd = {"it's \"quoted\"",  "two\nlines",   "100%_*",
                                          "\xf0\x9f\xa5\x81", "raw \xff\xfe", "-x,y:z"};
    for (const std::string& name : odd) write(name + ".wav", name);
    std::filesystem::create_directory_symlink(library(), library() + "/circle");
    std::filesystem::create_symlink("nowhere", library() + "/dead.wav");
    settle();
    std::vector<std::string> failures;
    const auto hear = [&failures](IndexOptions& options) {
        options.failed = [&failures](const Error& error) { failures.push_back(error.message()); };
    };
    EXPECT_EQ(index(hear).described, odd.size());
    EXPECT_THAT(failures, ElementsAre(HasSubstr(library() + "/dead.wav: ")));
    EXPECT_THAT(names(), testing::UnorderedElementsAreArray(odd));
    EXPECT_THAT(names("\"\xf0\x9f\xa5\x81\""), ElementsAre("\xf0\x9f\xa5\x81"));
    EXPECT_THAT(names("%"), ElementsAre("100%_*"));
    EXPECT_THAT(names("raw"), ElementsAre("raw \xff\xfe"));
    EXPECT_EQ(index().described, 0U);
}

TEST_F(Indexing, EntersFoldersThatLinkToEachOtherOnceAndByTheirOwnNames) {
    const std::string letters = "abcdef";
    folder_.write("elsewhere/Far.wav", "far");
    for (const char a : letters) {
        write(fmt::format("{}/Kick.wav", a), "");
        for (const char b : letters) {
            if (a != b)
                std::filesystem::create_directory_symlink(library() + "/" + b,
                                                          fmt::format("{}/{}/{}", library(), a, b));
        }
        std::filesystem::create_directory_symlink(folder_.path("elsewhere"),
                                                  fmt::format("{}/{}/far", library(), a));
    }
    std::filesystem::create_symlink(folder_.path("elsewhere/Far.wav"), library() + "/Link.wav");
    settle();
    std::size_t passedOver = 0;
    const auto walked = [&](LinksOutside outside) {
        passedOver = 0;
        return index([&](IndexOptions& options) {
                   options.links = {outside, [&](const URL& /*link*/) { ++passedOver; }};
               })
            .seen;
    };
    EXPECT_EQ(walked(LinksOutside::none), letters.size());
    EXPECT_EQ(passedOver, letters.size() + 1);
    EXPECT_EQ(walked(LinksOutside::files), letters.size() + 1);
    EXPECT_EQ(passedOver, letters.size());
    EXPECT_EQ(walked(LinksOutside::all), letters.size() + 2);
    EXPECT_EQ(passedOver, 0U);
    const auto database = ContentDatabase::open(this->database());
    for (const char a : letters) EXPECT_TRUE(database->item(fmt::format("{}/{}/Kick.wav", library(), a)));
    EXPECT_TRUE(database->item(library() + "/a/far/Far.wav"));
}

}  // namespace
}  // namespace qvct::test
