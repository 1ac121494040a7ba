#include "contentdb/store/upkeep/Merge.h"

#include "contentdb/store/Batches.h"
#include "contentdb/store/StoreWriter.h"
#include "contentdb/store/sqlite/Reading.h"
#include "contentdb/store/sqlite/Schema.h"
#include "contentdb/terms/Terms.h"

#include <algorithm>
#include <map>
#include <memory>
#include <set>

namespace qvct::contentdb {
namespace {

/// Folders in the order of a walk: a folder before what is in it, and siblings by name, so that "/" comes
/// before every other byte.
struct WalkOrder {
    bool operator()(const std::string& a, const std::string& b) const {
        return std::lexicographical_compare(a.begin(), a.end(), b.begin(), b.end(),
                                            [](char left, char right) { return rank(left) < rank(right); });
    }
    static int rank(char c) { return c == '/' ? 0 : static_cast<unsigned char>(c); }
};

struct Source {
    std::unique_ptr<Connection> connection;
    std::unique_ptr<ContentStore> store;
};

class Merge {
  public:
    Merge(const std::vector<std::string>& databases, const std::string& target)
        : connection_(openDatabase(target, Access::write)), writer_(*connection_) {
        for (const std::string& database : databases) {
            auto connection = openToRead(database);
            connection->run("BEGIN");  // one consistent state, whatever a run writes meanwhile
            auto store = std::make_unique<ContentStore>(*connection);
            sources_.push_back({std::move(connection), std::move(store)});
        }
    }

    void run() {
        writer_.setDescriber(describer());
        Batches batches(writer_);
        for (const auto& [path, sources] : folders()) addFolder(sources, batches);
        batches.end();
        connection_->emptyLog();
    }

  private:
    /// A folder as one source has it.
    struct SourceFolder {
        std::size_t source;
        std::int64_t folder;
    };
    using Folders = std::map<std::string, std::vector<SourceFolder>, WalkOrder>;

    /// The describer that all the sources have in common; 0 when they differ, so that the next run reads
    /// everything again.
    std::uint64_t describer() {
        std::set<std::uint64_t> describers;
        for (const Source& source : sources_) describers.insert(source.store->describer());
        return describers.size() == 1 ? *describers.begin() : 0;
    }

    Folders folders() {
        Folders folders;
        for (std::size_t i = 0; i < sources_.size(); ++i) {
            sources_[i].store->forEachFolder("/", [&](const FolderRecord& folder, std::string_view path) {
                folders[std::string(path)].push_back({i, folder.id});
            });
        }
        return folders;
    }

    /// The items of one folder by name, each from the first source that has it. The folder's digest is left
    /// open: the next run looks at the folder once and then knows it.
    void addFolder(const std::vector<SourceFolder>& sources, Batches& batches) {
        std::map<std::string, std::pair<std::size_t, ItemId>> items;
        for (const SourceFolder& its : sources) {
            for (const auto& [name, file] : sources_[its.source].store->files(its.folder))
                items.try_emplace(name, its.source, file.id);
        }
        for (const auto& [name, place] : items) {
            ContentStore& store = *sources_[place.first].store;
            const auto item = store.item(place.second);
            if (!item) continue;
            batches.put(++lastId_, *item, termsOf(*item));
            for (const std::string& path : store.earlierPaths(place.second))
                writer_.addEarlierPath(lastId_, path);
        }
    }

    std::unique_ptr<Connection> connection_;
    StoreWriter writer_;
    std::vector<Source> sources_;
    ItemId lastId_ = 0;
};

}  // namespace

void mergeInto(const std::string& target, const std::vector<std::string>& databases) {
    Merge(databases, target).run();
}

}  // namespace qvct::contentdb
