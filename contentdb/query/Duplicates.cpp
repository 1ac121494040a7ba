#include "contentdb/query/Duplicates.h"

#include "contentdb/query/Search.h"
#include "contentdb/query/SoundCopies.h"
#include "contentdb/store/Digest.h"
#include "contentdb/store/codec/SoundCodec.h"

#include <algorithm>
#include <cstdint>
#include <numeric>
#include <span>
#include <string>
#include <string_view>
#include <tuple>
#include <unordered_set>
#include <utility>
#include <vector>

namespace qvct::contentdb {
namespace {

/// A found item by its place among them.
using Ordinal = std::uint32_t;

/// So many landmarks are looked at together.
constexpr std::size_t kLandmarksAtOnce = 8'000'000;
/// Of the sounds that share a landmark, each is compared with so many that follow.
constexpr std::size_t kMostNeighbours = 32;
/// Copies do not lie farther apart.
constexpr int kFarthest = 300 * 300;
/// Pairs that are remembered as different.
constexpr std::size_t kMostDifferent = 1 << 20;

/// Sets that are united until none of them share a member; each is known by its first one.
class DisjointSets {
  public:
    explicit DisjointSets(std::size_t size) : parents_(size) {
        std::iota(parents_.begin(), parents_.end(), Ordinal{0});
    }
    Ordinal first(Ordinal member) {
        while (parents_[member] != member) member = parents_[member] = parents_[parents_[member]];
        return member;
    }
    void unite(Ordinal a, Ordinal b) {
        a = first(a);
        b = first(b);
        parents_[std::max(a, b)] = std::min(a, b);
    }

  private:
    std::vector<Ordinal> parents_;
};

class CopySearch {
  public:
    CopySearch(ContentStore& store, const Query& query)
        : store_(store), ids_(found(store, query)), sets_(ids_.size()) {}

    void run() {
        read();
        const std::size_t passes = prints_.size() / kLandmarkBytes / kLandmarksAtOnce + 1;
        for (std::size_t pass = 0; pass < passes; ++pass) uniteAltered(pass, passes);
    }

    /// The groups, each by the ordinals of its members.
    template <typename Visit>
    void forEachGroup(Visit visit) {
        std::vector<std::pair<Ordinal, Ordinal>> members;
        for (Ordinal i = 0; i < ids_.size(); ++i) members.emplace_back(sets_.first(i), i);
        std::sort(members.begin(), members.end());
        for (std::size_t at = 0, end = 0; at < members.size(); at = end) {
            while (end < members.size() && members[end].first == members[at].first) ++end;
            if (end - at > 1 && !visit(group(std::span(members).subspan(at, end - at)))) return;
        }
    }

  private:
    struct Landmark {
        std::uint32_t hash;
        Ordinal item;
        bool operator==(const Landmark&) const = default;
        bool operator<(const Landmark& other) const {
            return std::tie(hash, item) < std::tie(other.hash, other.item);
        }
    };

    static std::vector<std::uint32_t> found(ContentStore& store, const Query& query) {
        std::vector<std::uint32_t> ids;
        forEachFound(store, query, [&ids](std::int64_t chunk, const IdSet& found) {
            found.forEach([&](std::uint16_t id) {
                ids.push_back(static_cast<std::uint32_t>(chunk << kChunkBits | id));
                return true;
            });
        });
        return ids;
    }

    /// Notes all that is compared, and unites items of the same payload.
    void read() {
        std::vector<std::pair<std::uint64_t, Ordinal>> payloads;
        payloads.reserve(ids_.size());
        places_.resize(ids_.size());
        for (Ordinal i = 0; i < ids_.size(); ++i) {
            const auto item = store_.item(ids_[i]);
            if (item && !item->payloadHash.empty()) payloads.emplace_back(digestOf(item->payloadHash), i);
            if (item && decodedFingerprint(item->fingerprint)) prints_ += item->fingerprint;
            ends_.push_back(prints_.size());
            const auto likeness = item ? decodedLikeness(item->likeness) : std::nullopt;
            if (likeness) places_[i] = likeness->place;
        }
        std::sort(payloads.begin(), payloads.end());
        for (std::size_t i = 1; i < payloads.size(); ++i)
            if (payloads[i].first == payloads[i - 1].first)
                sets_.unite(payloads[i].second, payloads[i - 1].second);
    }

    static std::uint64_t digestOf(std::string_view payload) {
        Digest digest;
        digest.add(payload);
        return digest.value();
    }

    /// Unites what shares landmarks of one share of all hashes.
    void uniteAltered(std::size_t pass, std::size_t passes) {
        std::vector<Landmark> landmarks;
        for (Ordinal i = 0; i < ids_.size(); ++i) {
            if (sets_.first(i) != i) continue;
            for (const auto& landmark : fingerprintOf(i).landmarks)
                if (shareOf(landmark.hash, passes) == pass) landmarks.push_back({landmark.hash, i});
        }
        std::sort(landmarks.begin(), landmarks.end());
        landmarks.erase(std::unique(landmarks.begin(), landmarks.end()), landmarks.end());
        for (std::size_t at = 0, end = 0; at < landmarks.size(); at = end) {
            while (end < landmarks.size() && landmarks[end].hash == landmarks[at].hash) ++end;
            compareAll(std::span(landmarks).subspan(at, end - at));
        }
    }

    static std::size_t shareOf(std::uint32_t hash, std::size_t shares) {
        constexpr std::uint32_t kGolden = 0x9e3779b1;
        const std::uint32_t mixed = hash * kGolden;
        return static_cast<std::size_t>(std::uint64_t{mixed} * shares >> 32U);
    }

    /// Where many share a landmark, those that lie near each other.
    void compareAll(std::span<Landmark> sharing) {
        if (sharing.size() > kMostNeighbours) {
            std::sort(sharing.begin(), sharing.end(), [this](const Landmark& a, const Landmark& b) {
                return std::tie(places_[a.item].coordinates, a.item) <
                       std::tie(places_[b.item].coordinates, b.item);
            });
        }
        for (std::size_t i = 0; i < sharing.size(); ++i) {
            const std::size_t end = std::min(sharing.size(), i + 1 + kMostNeighbours);
            for (std::size_t k = i + 1; k < end; ++k) compare(sharing[i].item, sharing[k].item);
        }
    }

    void compare(Ordinal a, Ordinal b) {
        if (squaredDistance(places_[a], places_[b]) > kFarthest || sets_.first(a) == sets_.first(b)) return;
        const std::uint64_t pair = std::uint64_t{std::min(a, b)} << 32U | std::max(a, b);
        if (different_.contains(pair)) return;
        if (sharedPart(fingerprintOf(a), fingerprintOf(b)) >= kSharedByCopies) return sets_.unite(a, b);
        if (different_.size() >= kMostDifferent) different_.clear();
        different_.insert(pair);
    }

    SoundFingerprint fingerprintOf(Ordinal ordinal) const {
        const std::size_t begin = ordinal == 0 ? 0 : ends_[ordinal - 1];
        const auto bytes = std::string_view(prints_).substr(begin, ends_[ordinal] - begin);
        return decodedFingerprint(bytes).value_or(SoundFingerprint());
    }

    DuplicateGroup group(std::span<const std::pair<Ordinal, Ordinal>> members) {
        std::vector<std::pair<SoundCopy, std::string>> copies;
        for (const auto& [first, member] : members) {
            const ItemId id = ids_[member];
            if (const auto item = store_.item(id)) copies.emplace_back(copyOf(id, *item), item->payloadHash);
        }
        return bestFirst(std::move(copies));
    }

    ContentStore& store_;
    std::vector<std::uint32_t> ids_;
    DisjointSets sets_;
    std::vector<SoundLikeness> places_;
    std::string prints_;  // the fingerprints one after the other
    std::vector<std::size_t> ends_;
    std::unordered_set<std::uint64_t> different_;
};

}  // namespace

void forEachDuplicate(ContentStore& store, const Query& query,
                      const std::function<bool(const DuplicateGroup&)>& visit) {
    CopySearch search(store, query);
    search.run();
    search.forEachGroup(visit);
}

}  // namespace qvct::contentdb
