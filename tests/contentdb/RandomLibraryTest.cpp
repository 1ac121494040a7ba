// A library in which files and folders are moved, taken away, brought back, edited, tagged and linked at
// random, indexed again and again: whatever happened, the database then says what a new one would say.

#include "Library.h"
#include "platform/text/Url.h"
#include "support/RunTool.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <map>
#include <random>
#include <thread>

#include <fmt/format.h>
#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using namespace contentdb;
namespace fs = std::filesystem;

/// Takes the text of a file, or of the data in a bundle, for "sound|tag", and a record beside it for one more
/// tag.
class TextDescriber : public ItemDescriber {
  public:
    std::optional<IndexedItem> describe(const std::string& path, Error* error) override {
        const std::string text = readAll(fs::is_directory(path) ? path + "/data" : path);
        if (text.starts_with("broken")) {
            qvct::fail(error, kErrorMalformed, text);
            return std::nullopt;
        }
        IndexedItem item;
        item.name = URL::fileURLWithPath(path).lastPathComponentWithoutExtension();
        item.payloadHash = text.substr(0, text.find('|'));
        for (const std::string& tag : {text.substr(text.find('|') + 1), readAll(path + ".plist")})
            if (!tag.empty()) item.taggings.push_back({tag, "Genres", {}, {}, Provenance::stored, {}});
        return item;
    }
};

/// All that a database knows, by path; the changed time apart, which it leaves open where it is too young to
/// count.
std::map<std::string, IndexedItem> contents(const std::string& path) {
    std::map<std::string, IndexedItem> result;
    const auto add = [&result](IndexedItem item) {
        item.stamp.changed = 0;
        EXPECT_TRUE(result.emplace(item.path, item).second) << item.path;
        return true;
    };
    Error error;
    const auto database = ContentDatabase::open(path, &error);
    EXPECT_TRUE(database) << error.message();
    if (!database) return result;
    const auto all = database->search(*parseQuery("", {}, nullptr), 100000, &error);
    EXPECT_TRUE(all) << error.message();
    for (const Found& found : all.value_or(std::vector<Found>())) add(found.item);
    EXPECT_TRUE(database->forEachFailure(add));
    EXPECT_TRUE(database->check(&error)) << error.message();
    return result;
}

/// Whether a link to nowhere stands in the way, behind which everything may still be.
bool isBehindADeadLink(const fs::path& path) {
    for (fs::path at = path; at != at.root_path(); at = at.parent_path())
        if (fs::is_symlink(at) && !fs::exists(at)) return true;
    return false;
}

class ChangingLibrary {
  public:
    ChangingLibrary() {
        for (const char* place : {"library/Stays", "outside", "aside"})
            fs::create_directories(folder_.path(place));
        folder_.write("library/Stays/Kick.wav", "stays|Jazz");
        folder_.write("outside/Far.wav", "far|Jazz");
    }

    /// What the steps were, for when it fails.
    std::string live(std::uint32_t seed, int count) {
        using Step = void (ChangingLibrary::*)();
        const std::pair<Step, std::size_t> steps[] = {
            {&ChangingLibrary::makeOrEdit, 5},  {&ChangingLibrary::breakFile, 1},
            {&ChangingLibrary::makeFolder, 3},  {&ChangingLibrary::tag, 2},
            {&ChangingLibrary::tagBeside, 1},   {&ChangingLibrary::copy, 1},
            {&ChangingLibrary::moveFile, 3},    {&ChangingLibrary::moveFolder, 4},
            {&ChangingLibrary::swapFolders, 1}, {&ChangingLibrary::takeAway, 3},
            {&ChangingLibrary::bringBack, 4},   {&ChangingLibrary::remove, 1},
            {&ChangingLibrary::link, 1},        {&ChangingLibrary::indexAndCompare, 10}};
        std::vector<Step> weighted;
        for (const auto& [step, weight] : steps) weighted.insert(weighted.end(), weight, step);
        random_.seed(seed);
        while (count-- > 0 && !testing::Test::HasFailure()) (this->*oneOf(weighted))();
        std::string told = fmt::format("QVCT_SEED={}, in {}:\n", seed, folder_.path());
        for (const std::string& step : steps_) told += step + "\n";
        return told;
    }

  private:
    std::size_t pick(std::size_t count) { return random_() % count; }
    template <typename T>
    const T& oneOf(const std::vector<T>& all) {
        return all[pick(all.size())];
    }

    static bool isBundle(const fs::path& path) { return path.extension() == ".patch"; }
    static bool isFolder(const fs::path& path) {
        return fs::is_directory(path) && !fs::is_symlink(path) && !isBundle(path);
    }
    /// What lies in the library and is of a kind, links as they are, in the order of names.
    std::vector<fs::path> all(const std::function<bool(const fs::path&)>& isOfKind) const {
        std::vector<fs::path> paths;
        for (auto at = fs::recursive_directory_iterator(library()); at != fs::recursive_directory_iterator();
             ++at) {
            if (isBundle(at->path())) at.disable_recursion_pending();
            if (at->path() != stays() && at->path().parent_path() != stays() && isOfKind(at->path()))
                paths.push_back(at->path());
        }
        std::sort(paths.begin(), paths.end());
        return paths;
    }
    static std::vector<fs::path> with(std::vector<fs::path> paths, const fs::path& more) {
        paths.push_back(more);
        return paths;
    }
    fs::path someFolder() { return oneOf(with(all(isFolder), library())); }
    fs::path someFile() {
        return oneOf(with(all([](const fs::path& path) { return !isFolder(path); }), {}));
    }
    fs::path someThing() {
        return oneOf(with(all([](const fs::path& /*path*/) { return true; }), {}));
    }
    fs::path newPlace() { return someFolder() / oneOf(kFileNames); }

    void say(const std::string& step) { steps_.push_back(step); }
    std::string text() { return fmt::format("{}|{}", ++lastSound_, oneOf(kTags)); }

    void put(const fs::path& path, const std::string& bytes) {
        if (fs::is_symlink(path) || isFolder(path) || (isBundle(path) && fs::is_regular_file(path))) return;
        say(fmt::format("write {}: {}", path.string(), bytes));
        if (isBundle(path)) fs::create_directories(path);
        std::ofstream(isBundle(path) ? path / "data" : path) << bytes;
    }
    /// Never over something, nor a folder into itself.
    void move(const fs::path& from, const fs::path& to) {
        const bool isInItself = (to.string() + "/").starts_with(from.string() + "/");
        if (!fs::exists(fs::symlink_status(from)) || fs::exists(fs::symlink_status(to)) || isInItself) return;
        if (!fs::is_directory(to.parent_path())) return;
        say(fmt::format("move {} to {}", from.string(), to.string()));
        fs::rename(from, to);
    }

    void makeOrEdit() { put(pick(3) == 0 && !someFile().empty() ? someFile() : newPlace(), text()); }
    void breakFile() { put(newPlace(), "broken"); }
    void makeFolder() {
        const fs::path path = someFolder() / oneOf(kFolderNames);
        if (fs::exists(fs::symlink_status(path))) return;
        say("make " + path.string());
        fs::create_directory(path);
    }
    /// As a writer does: the file is replaced, its sound stays.
    void tag() {
        const fs::path path = someFile();
        if (path.empty() || isBundle(path) || fs::is_symlink(path)) return;
        const std::string sound = readAll(path.string());
        put(path.string() + "-new", sound.substr(0, sound.find('|')) + "|" + oneOf(kTags));
        fs::rename(path.string() + "-new", path);
    }
    void tagBeside() {
        if (const fs::path path = someFile(); path.extension() == ".cst")
            put(path.string() + ".plist", oneOf(kTags));
    }
    void copy() {
        const fs::path from = someFile();
        if (!from.empty() && fs::is_regular_file(from)) put(newPlace(), readAll(from.string()));
    }
    void moveFile() { move(someFile(), newPlace()); }
    void moveFolder() {
        const auto folders = all(isFolder);
        if (!folders.empty()) move(oneOf(folders), someFolder() / oneOf(kFolderNames));
    }
    void swapFolders() {
        const auto folders = all(isFolder);
        if (folders.empty()) return;
        const fs::path a = oneOf(folders);
        const fs::path b = oneOf(folders);
        move(a, aside() / "swapped");
        move(b, a);
        if (fs::exists(aside() / "swapped")) move(aside() / "swapped", fs::exists(b) ? a : b);
        if (fs::exists(aside() / "swapped")) takeAside(aside() / "swapped", b);
    }
    void takeAway() {
        if (const fs::path path = someThing(); !path.empty()) takeAside(path, path);
    }
    void takeAside(const fs::path& path, const fs::path& from) {
        const fs::path to = aside() / std::to_string(++lastAside_);
        move(path, to);
        away_.emplace_back(to, from);
    }
    void bringBack() {
        if (away_.empty()) return;
        const std::size_t which = pick(away_.size());
        const auto [path, from] = away_[which];
        move(path, pick(4) == 0 ? someFolder() / from.filename() : from);
        if (!fs::exists(fs::symlink_status(path)))
            away_.erase(away_.begin() + static_cast<std::ptrdiff_t>(which));
    }
    void remove() {
        const fs::path path = someThing();
        if (path.empty()) return;
        say("remove " + path.string());
        fs::remove_all(path);
    }
    void link() {
        const fs::path target = pick(3) == 0 ? fs::path(folder_.path("outside")) : someThing();
        const bool isToFile = !target.empty() && !fs::is_directory(target);
        const fs::path path = someFolder() / oneOf(isToFile ? kFileNames : kFolderNames);
        if (target.empty() || isBundle(target) || fs::exists(fs::symlink_status(path))) return;
        say(fmt::format("link {} to {}", path.string(), target.string()));
        fs::create_symlink(target, path);
    }

    void index(const std::function<void(IndexOptions&)>& change, const std::string& database) {
        IndexOptions options;
        options.folders = {library()};
        options.database = database;
        options.workers = 1;
        change(options);
        Error error;
        EXPECT_TRUE(indexLibrary(
            options, [] { return std::make_unique<TextDescriber>(); }, &error))
            << error.message();
    }
    void indexAndCompare() {
        const bool prunes = pick(3) == 0;
        const unsigned parts = pick(3) == 0 ? 2 : 1;
        const bool isOnlyAPart = parts > 1 && pick(3) == 0;
        say(fmt::format("index{}{}{}", prunes ? " --prune" : "", parts > 1 ? " by parts" : "",
                        isOnlyAPart ? ", the first" : ""));
        // Mostly until what was written is older than a tick of the file system's clock.
        if (pick(4) != 0) std::this_thread::sleep_for(std::chrono::milliseconds(21));
        for (unsigned part = 1; part <= (isOnlyAPart ? 1 : parts); ++part) {
            index(
                [&](IndexOptions& options) {
                    options.prune = prunes;
                    options.part = part;
                    options.parts = parts;
                },
                databases_.path("db"));
        }
        if (isOnlyAPart) return;
        for (const char* rest : {"new", "new-wal", "new-shm"}) fs::remove(databases_.path(rest));
        index([](IndexOptions& /*options*/) {}, databases_.path("new"));
        const auto expected = contents(databases_.path("new"));
        auto known = contents(databases_.path("db"));
        // What is missing is kept until it is pruned, and what may be only out of reach.
        std::erase_if(known, [&](const auto& entry) {
            return !expected.contains(entry.first) && (!prunes || isBehindADeadLink(entry.first));
        });
        for (const auto& [path, item] : expected) {
            const auto hit = known.find(path);
            EXPECT_TRUE(hit != known.end() && hit->second == item) << path << " is not known as it is";
            if (hit != known.end()) known.erase(hit);
        }
        for (const auto& [path, item] : known) ADD_FAILURE() << path << " was not pruned";
    }

    std::string library() const { return folder_.path("library"); }
    fs::path stays() const { return folder_.path("library/Stays"); }
    fs::path aside() const { return folder_.path("aside"); }

    const std::vector<std::string> kFileNames = {"Kick.wav", "Snare.wav", "Pad.cst", "Bass.cst",
                                                 "Bell.patch"};
    const std::vector<std::string> kFolderNames = {"a", "b", "c", "Kick.wav"};
    const std::vector<std::string> kTags = {"House", "Jazz", "Techno"};

    TemporaryFolder folder_;
    // In memory where there is such a place: each index waits for the disk.
    TemporaryFolder databases_{fs::is_directory("/dev/shm") ? fs::path("/dev/shm")
                                                            : fs::temp_directory_path()};
    std::mt19937 random_;
    std::vector<std::string> steps_;
    std::vector<std::pair<fs::path, fs::path>> away_;  // where it is, and where it was
    int lastSound_ = 0;
    int lastAside_ = 0;
};

TEST(RandomLibrary, IsKnownAsANewDatabaseWouldKnowIt) {
    const char* given = std::getenv("QVCT_SEED");
    ChangingLibrary library;
    const std::string steps = library.live(
        given != nullptr ? static_cast<std::uint32_t>(std::strtoul(given, nullptr, 10)) : 1, 1000);
    EXPECT_FALSE(HasFailure()) << steps;
}

}  // namespace
}  // namespace qvct::test
