#include "contentdb/ContentDatabase.h"

#include "autotagging/names/Thesaurus.h"
#include "contentdb/ContentDescriber.h"
#include "contentdb/query/Duplicates.h"
#include "contentdb/query/NearestSounds.h"
#include "contentdb/query/Search.h"
#include "contentdb/query/SimilarItems.h"
#include "contentdb/store/sqlite/Reading.h"
#include "contentdb/store/sqlite/RunLock.h"
#include "contentdb/store/upkeep/StoreCheck.h"
#include "contentdb/terms/Terms.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <algorithm>

namespace qvct::contentdb {

struct ContentDatabase::Implementation {
    explicit Implementation(const std::string& path) : connection(openToRead(path)), store(*connection) {}

    /// Runs `work` on one state of the database, whatever is written meanwhile.
    template <typename Work>
    auto read(Error* error, Work work) -> std::optional<decltype(work())> {
        using Result = std::optional<decltype(work())>;
        return guarded(error, Result(), [&]() -> Result {
            connection->run("BEGIN");
            try {
                Result result = work();
                connection->run("COMMIT");
                return result;
            } catch (const DatabaseFailure&) {
                if (connection->isInTransaction()) connection->run("ROLLBACK");
                throw;
            }
        });
    }

    /// The query, with the sound that it names looked up or listened to.
    std::optional<Query> withSound(const Query& query, Error* error) {
        if (!query.like || !query.like->likeness.empty()) return query;
        auto likeness = likenessOf(URL::fileURLWithPath(query.like->file).path(), error);
        if (!likeness) return std::nullopt;
        Query result = query;
        result.like->likeness = std::move(*likeness);
        return result;
    }

    /// What is stored of the item at the path, or else heard in the file; nothing and an error when that is
    /// nothing.
    std::optional<std::string> likenessOf(const std::string& path, Error* error) {
        auto stored = read(error, [&] {
            const auto id = store.idOfPath(path);
            const auto item = id ? store.item(*id) : std::nullopt;
            return item ? item->likeness : std::string();
        });
        if (!stored || !stored->empty()) return stored;
        ContentDescriber listener(QVCTAutoTaggingOptionSound);
        auto heard = listener.describe(path, error);
        if (!heard) return std::nullopt;
        if (!heard->likeness.empty()) return std::move(heard->likeness);
        fail(error, kErrorInvalidArgument, "there is nothing to hear in it", {path});
        return std::nullopt;
    }

    /// Runs `work(query)` for a query of which the sound is known.
    template <typename Work>
    auto readFor(const Query& query, Error* error, Work work) -> std::optional<decltype(work(query))> {
        const auto whole = withSound(query, error);
        if (!whole) return std::nullopt;
        return read(error, [&] { return work(*whole); });
    }

    std::unique_ptr<Connection> connection;
    ContentStore store;
};

ContentDatabase::ContentDatabase(std::unique_ptr<Implementation> implementation)
    : implementation_(std::move(implementation)) {}
ContentDatabase::~ContentDatabase() = default;

std::unique_ptr<ContentDatabase> ContentDatabase::open(const std::string& path, Error* error) {
    auto implementation = guarded(error, std::unique_ptr<Implementation>(),
                                  [&] { return std::make_unique<Implementation>(path); });
    if (!implementation) return nullptr;
    return std::unique_ptr<ContentDatabase>(new ContentDatabase(std::move(implementation)));
}

std::optional<Vocabulary> ContentDatabase::vocabulary(Error* error) {
    return implementation_->read(error, [this] {
        Vocabulary vocabulary{implementation_->store.fields(false), implementation_->store.fields(true)};
        for (const auto& category : TGRTTaxonomy::defaultTaxonomy()->categories()) {
            const auto& known = vocabulary.categories;
            if (std::find(known.begin(), known.end(), category->identifier()) == known.end())
                vocabulary.categories.push_back(category->identifier());
        }
        vocabulary.tagMeant = [thesaurus = std::shared_ptr<Thesaurus>()](std::string_view word) mutable {
            if (!thesaurus) thesaurus = std::make_shared<Thesaurus>();
            return thesaurus->tagMeant(word);
        };
        return vocabulary;
    });
}

std::optional<std::vector<Found>> ContentDatabase::search(const Query& query, std::size_t limit,
                                                          Error* error) {
    return implementation_->readFor(query, error, [&](const Query& whole) {
        return contentdb::search(implementation_->store, whole, limit);
    });
}

std::optional<std::int64_t> ContentDatabase::count(const Query& query, Error* error) {
    return implementation_->readFor(
        query, error, [&](const Query& whole) { return countMatches(implementation_->store, whole); });
}

std::optional<std::vector<Facet>> ContentDatabase::facets(const Query& query, Error* error) {
    return implementation_->readFor(
        query, error, [&](const Query& whole) { return contentdb::facets(implementation_->store, whole); });
}

std::optional<std::vector<Similar>> ContentDatabase::similar(std::string_view path, std::size_t limit,
                                                             Error* error) {
    const auto found = item(path, error);
    if (!found) return std::nullopt;
    const auto refuse = [&](const std::string& reason) {
        fail(error, kErrorInvalidArgument, reason, {std::string(path)});
        return std::nullopt;
    };
    if (!found->item.failure.empty()) return refuse("could not be read when it was indexed");
    if (!isComparable(found->item))
        return refuse("no tags, rhythm or tempo by which others could be similar");
    return implementation_->read(error,
                                 [&] { return similarItems(implementation_->store, found->id, limit); });
}

std::optional<std::vector<Similar>> ContentDatabase::soundingLike(std::string_view path, std::size_t limit,
                                                                  Error* error) {
    const auto likeness = implementation_->likenessOf(std::string(path), error);
    if (!likeness) return std::nullopt;
    return implementation_->read(error, [&] {
        ContentStore& store = implementation_->store;
        return soundsLike(store, *likeness, store.idOfPath(path), limit);
    });
}

bool ContentDatabase::forEachDuplicate(const Query& query,
                                       const std::function<bool(const DuplicateGroup&)>& visit,
                                       Error* error) {
    return implementation_
        ->readFor(query, error,
                  [&](const Query& whole) {
                      contentdb::forEachDuplicate(implementation_->store, whole, visit);
                      return true;
                  })
        .has_value();
}

std::optional<Found> ContentDatabase::item(std::string_view path, Error* error) {
    const auto found = implementation_->read(error, [&]() -> std::optional<Found> {
        const auto id = implementation_->store.idOfPath(path);
        auto item = id ? implementation_->store.item(*id) : std::nullopt;
        if (!item) return std::nullopt;
        return Found{*id, std::move(*item)};
    });
    if (found && !*found) fail(error, kErrorInvalidArgument, "not in the index", {std::string(path)});
    return found ? *found : std::nullopt;
}

std::optional<std::vector<std::string>> ContentDatabase::earlierPaths(ItemId id, Error* error) {
    return implementation_->read(error, [&] { return implementation_->store.earlierPaths(id); });
}

std::optional<ContentDatabase::Totals> ContentDatabase::totals(Error* error) {
    return implementation_->read(error, [this] {
        return Totals{implementation_->store.countOfItems(), implementation_->store.countOfFailures()};
    });
}

bool ContentDatabase::forEachFailure(const std::function<bool(const IndexedItem&)>& visit, Error* error) {
    return implementation_
        ->read(error,
               [&] {
                   implementation_->store.forEachFailure(visit);
                   return true;
               })
        .has_value();
}

bool ContentDatabase::isBeingIndexed() const {
    return RunLock::isHeld(implementation_->connection->path());
}

bool ContentDatabase::check(Error* error) {
    return implementation_
        ->read(error,
               [this] {
                   checkStore(implementation_->store);
                   return true;
               })
        .has_value();
}

}  // namespace qvct::contentdb
