// What sounds like a sound, and which sounds are there twice, in a large library: times, and how much of what
// comparing everything finds.
//
//   bench_sound_search search ITEMS FOLDER...
//   bench_sound_search duplicates ITEMS FOLDER...
//
// The sounds in the folders are listened to. The library is made of them: each item lies as far from one of
// them, drawn anew, as that lies from its nearest neighbour, or less; of every eight one begins a run of up
// to 16 that lie within rounding of each other. An eighth has copies, which keep three quarters of their
// landmarks and have a bit of the others changed; all other landmarks are drawn from those of the sounds. It
// is made in the folder for temporary files and removed at the end: 1.3 GB for a million items.

#include "Measure.h"
#include "contentdb/ContentDatabase.h"
#include "contentdb/query/NearestSounds.h"
#include "contentdb/store/StoreWriter.h"
#include "contentdb/store/codec/SoundCodec.h"
#include "contentdb/terms/Terms.h"
#include "support/ItemGenerator.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <random>
#include <set>
#include <string>
#include <vector>

#include <fmt/format.h>
#include <unistd.h>

namespace {

using namespace qvct;
using namespace qvct::contentdb;
namespace fs = std::filesystem;

constexpr std::size_t kWanted = 10;

struct RealSound {
    SoundLikeness place;
    SoundFingerprint fingerprint;
    double distance = 0;  // to its nearest neighbour
};

void stopIf(bool isWrong, const std::string& reason) {
    if (!isWrong) return;
    fmt::print(stderr, "{}\n", reason);
    std::exit(1);
}

double distanceToNearest(const std::vector<RealSound>& sounds, const RealSound& one) {
    int nearest = std::numeric_limits<int>::max();
    for (const RealSound& other : sounds)
        if (&other != &one) nearest = std::min(nearest, squaredDistance(one.place, other.place));
    return std::sqrt(nearest);
}

std::vector<RealSound> heard(const std::vector<std::string>& folders, const std::string& path) {
    IndexOptions options;
    options.folders = folders;
    options.database = path;
    options.worker = {QVCT_INDEX_WORKER, {std::to_string(QVCTAutoTaggingOptionSound)}};
    Error error;
    stopIf(!indexLibrary(options, &error), error.message());
    const auto database = ContentDatabase::open(path, &error);
    stopIf(!database, error.message());
    std::vector<RealSound> sounds;
    const auto all = database->search(Query{}, 1'000'000, &error);
    stopIf(!all, error.message());
    for (const Found& found : *all) {
        const auto likeness = decodedLikeness(found.item.likeness);
        const auto fingerprint = decodedFingerprint(found.item.fingerprint);
        if (likeness && fingerprint) sounds.push_back({likeness->place, *fingerprint});
    }
    stopIf(sounds.size() < 2, "no sounds there");
    for (RealSound& sound : sounds) sound.distance = distanceToNearest(sounds, sound);
    return sounds;
}

/// Draws places and fingerprints as described above.
class Library {
  public:
    explicit Library(std::vector<RealSound> sounds) : sounds_(std::move(sounds)) {
        for (const RealSound& sound : sounds_)
            for (const auto& landmark : sound.fingerprint.landmarks) pool_.push_back(landmark);
    }

    IndexedItem next(std::size_t number) {
        IndexedItem item = items_.next(number);
        if (runs_ > 0) {
            --runs_;
            place_ = near(place_, 1);
        } else {
            place_ = elsewhere();
            if (items_.pick(8) == 0) runs_ = items_.pick(16);
        }
        item.likeness = encodedLikeness(place_);
        if (copies_ > 0) {
            --copies_;
            item.fingerprint = encodedFingerprint(altered());
            item.likeness = encodedLikeness(near(copied_, 1));
        } else {
            fingerprint_ = drawn();
            item.fingerprint = encodedFingerprint(fingerprint_);
            if (items_.pick(8) == 0) {
                copies_ = 1 + items_.pick(3);
                copied_ = place_;
                ++groups_;
            }
        }
        return item;
    }
    /// Near one of the sounds.
    SoundLikeness elsewhere() {
        const RealSound& sound = sounds_[items_.pick(sounds_.size())];
        const double share = std::uniform_real_distribution<>(0, 1)(random_);
        return near(sound.place, share * sound.distance / std::sqrt(SoundLikeness::kSize));
    }
    std::size_t groups() const { return groups_; }

  private:
    SoundLikeness near(SoundLikeness place, double spread) {
        for (std::int8_t& coordinate : place.coordinates) {
            const double value = coordinate + std::normal_distribution<>(0, spread)(random_);
            coordinate = static_cast<std::int8_t>(std::clamp(std::round(value), -128.0, 127.0));
        }
        return place;
    }
    SoundFingerprint drawn() {
        SoundFingerprint fingerprint;
        const std::size_t count = sounds_[items_.pick(sounds_.size())].fingerprint.landmarks.size();
        for (std::size_t i = 0; i < count && !pool_.empty(); ++i)
            fingerprint.landmarks.push_back(pool_[items_.pick(pool_.size())]);
        std::sort(fingerprint.landmarks.begin(), fingerprint.landmarks.end(),
                  [](const auto& a, const auto& b) { return a.frame < b.frame; });
        return fingerprint;
    }
    SoundFingerprint altered() {
        SoundFingerprint fingerprint = fingerprint_;
        for (auto& landmark : fingerprint.landmarks)
            if (items_.pick(4) == 0) landmark.hash ^= 1U << items_.pick(32);
        return fingerprint;
    }

    std::vector<RealSound> sounds_;
    std::vector<SoundFingerprint::Landmark> pool_;
    test::ItemGenerator items_{1};
    std::mt19937 random_{1};
    SoundLikeness place_, copied_;
    SoundFingerprint fingerprint_;
    std::size_t runs_ = 0, copies_ = 0, groups_ = 0;
};

struct Stored {
    std::string path;
    SoundLikeness place;
};

std::vector<Stored> fill(const std::string& path, std::size_t count, Library& library) {
    const auto connection = openDatabase(path, Access::write);
    StoreWriter writer(*connection);
    std::vector<Stored> stored;
    constexpr std::size_t batch = 8192;
    for (std::size_t i = 0; i < count; i += batch) {
        writer.begin();
        for (std::size_t at = i; at < std::min(count, i + batch); ++at) {
            IndexedItem item = library.next(at + 1);
            writer.put(static_cast<ItemId>(at + 1), item, termsOf(item));
            stored.push_back({item.path, decodedLikeness(item.likeness)->place});
        }
        writer.commit();
    }
    return stored;
}

/// The distances of the nearest, by comparing all.
std::vector<int> nearestOfAll(const std::vector<Stored>& all, const SoundLikeness& place, std::size_t self) {
    std::vector<int> distances;
    distances.reserve(all.size());
    for (std::size_t i = 0; i < all.size(); ++i)
        if (i != self) distances.push_back(squaredDistance(place, all[i].place));
    const auto end = distances.begin() + static_cast<std::ptrdiff_t>(std::min(kWanted, distances.size()));
    std::partial_sort(distances.begin(), end, distances.end());
    distances.erase(end, distances.end());
    return distances;
}

/// Times in milliseconds, and how many of the nearest were found.
class Tally {
  public:
    void addTimes(double found, double compared) {
        found_.push_back(found * 1e3);
        compared_.push_back(compared * 1e3);
    }
    /// `found`, farthest last, against all that is as near as the last of `right`.
    void addHits(const std::vector<int>& found, const std::vector<int>& right) {
        wanted_ += right.size();
        for (const int distance : found) hits_ += distance <= right.back() ? 1 : 0;
    }
    void printTimes(const std::string& what, std::string_view target) {
        bench::printRow("  " + what + ", ten nearest", times(found_), target);
    }
    void print(const std::string& what) {
        printTimes(what, "p99 under 15 ms");
        bench::printRow("  by comparing all, in memory", times(compared_), "baseline");
        bench::printRow("  found of what that finds",
                        fmt::format("{:.4f}", static_cast<double>(hits_) / static_cast<double>(wanted_)),
                        "0.99");
    }

  private:
    static std::string times(std::vector<double>& times) {
        std::sort(times.begin(), times.end());
        return fmt::format("p50 {:.2f}, p99 {:.2f} ms", times[times.size() / 2],
                           times[times.size() * 99 / 100]);
    }

    std::vector<double> found_, compared_;
    std::size_t hits_ = 0, wanted_ = 0;
};

void benchItems(ContentDatabase& database, const std::vector<Stored>& all) {
    Tally tally;
    for (std::size_t i = 0; i < 1000; ++i) {
        const std::size_t self = i * 7919 % all.size();
        std::vector<Similar> found;
        std::vector<int> right;
        const double finding = bench::secondsOf(
            [&] { found = *database.soundingLike(all[self].path, kWanted); }, bench::processorTime);
        const double comparing = bench::secondsOf([&] { right = nearestOfAll(all, all[self].place, self); });
        tally.addTimes(finding, comparing);
        std::vector<int> distances;
        for (const Similar& one : found)
            distances.push_back(squaredDistance(all[self].place, decodedLikeness(one.item.likeness)->place));
        tally.addHits(distances, right);
    }
    tally.print("like an item of the database");
}

void benchOthers(ContentDatabase& database, const std::vector<Stored>& all, Library& library,
                 const std::string& rest) {
    Tally tally;
    const auto query = parseQuery(rest, *database.vocabulary(), nullptr);
    for (std::size_t i = 0; i < (rest.empty() ? 1000 : 100); ++i) {
        const SoundLikeness place = library.elsewhere();
        Query like = *query;
        like.like = SoundToMeet{"", encodedLikeness(place)};
        std::vector<Found> found;
        std::vector<int> right;
        const double finding =
            bench::secondsOf([&] { found = *database.search(like, kWanted); }, bench::processorTime);
        const double comparing =
            bench::secondsOf([&] { right = nearestOfAll(all, place, all.size()); }, bench::processorTime);
        tally.addTimes(finding, comparing);
        std::vector<int> distances;
        for (const Found& one : found)
            distances.push_back(squaredDistance(place, decodedLikeness(one.item.likeness)->place));
        if (rest.empty()) tally.addHits(distances, right);
    }
    if (rest.empty()) return tally.print("like a sound that is not there");
    tally.printTimes("the same with " + rest, "");
}

void benchDuplicates(ContentDatabase& database, std::size_t count, std::size_t made) {
    std::size_t groups = 0;
    const auto countGroups = [&groups](const DuplicateGroup& /*group*/) {
        ++groups;
        return true;
    };
    const double seconds =
        bench::secondsOf([&] { database.forEachDuplicate(Query{}, countGroups); }, bench::processorTime);
    bench::printRow(fmt::format("  duplicates: {} groups of {} found", groups, made),
                    fmt::format("{:.1f} s, {:.0f}/s", seconds, static_cast<double>(count) / seconds),
                    "minutes for a million");
}

}  // namespace

int main(int argc, char** argv) {
    const std::string_view what = argc > 3 ? argv[1] : "";
    stopIf(what != "search" && what != "duplicates",
           "usage: bench_sound_search search|duplicates ITEMS FOLDER...");
    const std::size_t count = std::strtoull(argv[2], nullptr, 10);
    std::string folder = (fs::temp_directory_path() / "qvct-bench-XXXXXX").string();
    stopIf(::mkdtemp(folder.data()) == nullptr, "no folder for temporary files");
    std::vector<std::string> folders(argv + 3, argv + argc);
    std::erase_if(folders, [](const std::string& each) { return !fs::is_directory(each); });
    auto sounds = heard(folders, folder + "/real.db");
    const std::size_t real = sounds.size();
    Library library(std::move(sounds));
    std::vector<Stored> all;
    const double filling = bench::secondsOf([&] { all = fill(folder + "/db", count, library); });
    bench::printRow(fmt::format("{} sounds near {} real ones, stored", count, real),
                    fmt::format("{:.0f} s, {:.0f}/s", filling, static_cast<double>(count) / filling), "");
    const auto database = ContentDatabase::open(folder + "/db");
    if (what == "search") {
        benchItems(*database, all);
        benchOthers(*database, all, library, "");
        benchOthers(*database, all, library, "tag:House bpm:100..140");
    } else {
        benchDuplicates(*database, count, library.groups());
    }
    fs::remove_all(folder);
    return 0;
}
