#include "contentdb/store/ContentStore.h"

#include "contentdb/store/codec/ItemCodec.h"
#include "contentdb/store/codec/StampColumns.h"
#include "platform/files/Paths.h"
#include "platform/text/Text.h"

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

/// The items that a condition picks.
std::string itemsWhere(std::string_view condition) {
    return fmt::format(
        "SELECT folder.path, item.file, payload, description, {} FROM item "
        "JOIN folder ON folder.id = item.folder WHERE {}",
        kStampColumns, condition);
}

IndexedItem readItem(const Statement& row, const Connection& connection) {
    IndexedItem item;
    item.path = pathIn(row.bytes(0), row.bytes(1));
    item.payloadHash = row.bytes(2);
    item.stamp = stampIn(row, 4);
    if (!decodeDescription(row.bytes(3), item)) {
        throw DatabaseFailure(kErrorMalformed,
                              fmt::format("the database is damaged: the record of {}", printable(item.path)),
                              connection.path());
    }
    return item;
}

FolderRecord folderIn(const Statement& row) {
    return {row.integer(0), row.unsignedInteger(1), row.integer(2),
            Part{static_cast<unsigned>(row.integer(3)), static_cast<unsigned>(row.integer(4))}};
}

}  // namespace

ContentStore::ContentStore(Connection& connection)
    : connection_(connection),
      item_(connection, itemsWhere("item.id = ?")),
      idOfPath_(
          connection,
          "SELECT item.id FROM folder JOIN item ON item.folder = folder.id WHERE path = ? AND file = ?"),
      term_(connection, "SELECT id FROM term WHERE value = ?"),
      terms_(connection, "SELECT id, value FROM term WHERE value >= ? AND value < ? ORDER BY value"),
      posting_(connection, "SELECT ids FROM posting WHERE key = ?"),
      folder_(connection, "SELECT id, digest, gone, part, parts FROM folder WHERE path = ?") {}

std::optional<IndexedItem> ContentStore::item(ItemId id) {
    std::optional<IndexedItem> result;
    item_.reset();  // after a record that could not be decoded
    item_.bind(1, id);
    if (item_.step()) result = readItem(item_, connection_);
    item_.reset();
    return result;
}

std::optional<ItemId> ContentStore::idOfPath(std::string_view path) {
    const Place place = placeOf(path);
    std::optional<ItemId> id;
    if (idOfPath_.bind(1, place.folder).bind(2, place.file).step()) id = idOfPath_.integer(0);
    idOfPath_.reset();
    return id;
}

std::vector<std::string> ContentStore::earlierPaths(ItemId id) {
    Statement statement(connection_, "SELECT path FROM earlier_path WHERE item = ?");
    std::vector<std::string> paths;
    for (statement.bind(1, id); statement.step();) paths.emplace_back(statement.bytes(0));
    return paths;
}

FolderRecord ContentStore::folder(std::string_view path) {
    FolderRecord record;
    if (folder_.bind(1, path).step()) record = folderIn(folder_);
    folder_.reset();
    return record;
}

std::map<std::string, FileRecord, std::less<>> ContentStore::files(std::int64_t folder) {
    Statement statement(connection_,
                        fmt::format("SELECT file, id, failed, {} FROM item WHERE folder = ?", kStampColumns));
    std::map<std::string, FileRecord, std::less<>> files;
    for (statement.bind(1, folder); statement.step();) {
        files[std::string(statement.bytes(0))] = {statement.integer(1), stampIn(statement, 3),
                                                  statement.integer(2) != 0};
    }
    return files;
}

void ContentStore::forEachFolder(std::string_view path,
                                 const std::function<void(const FolderRecord&, std::string_view)>& visit) {
    // Everything below "a" begins with "a/" and is less than "a0", '0' being the byte after '/'.
    const std::string_view base = path == "/" ? std::string_view() : path;
    const std::string below = std::string(base) + "/";
    const std::string behind = std::string(base) + "0";
    Statement statement(connection_,
                        "SELECT id, digest, gone, part, parts, path FROM folder WHERE path = ?1 OR (path >= "
                        "?2 AND path < ?3)");
    for (statement.bind(1, path).bind(2, below).bind(3, behind); statement.step();) {
        visit(folderIn(statement), statement.bytes(5));
    }
}

ItemId ContentStore::lastId() {
    return connection_.number("SELECT max(id) FROM item");
}

std::int64_t ContentStore::countOfItems() {
    return connection_.number("SELECT count(*) FROM item");
}

std::int64_t ContentStore::countOfFailures() {
    return connection_.number("SELECT count(*) FROM item WHERE failed = 1");
}

std::uint64_t ContentStore::describer() {
    return static_cast<std::uint64_t>(
        connection_.number("SELECT value FROM setting WHERE name = 'describer'"));
}

void ContentStore::forEachFailure(const std::function<bool(const IndexedItem&)>& visit) {
    Statement statement(connection_, itemsWhere("failed = 1 ORDER BY item.id"));
    while (statement.step() && visit(readItem(statement, connection_))) {
    }
}

std::vector<ContentStore::Tag> ContentStore::tags() {
    Statement statement(connection_, "SELECT term, label, category FROM tag ORDER BY category, label");
    std::vector<Tag> tags;
    while (statement.step()) {
        tags.push_back(
            {statement.integer(0), std::string(statement.bytes(1)), std::string(statement.bytes(2))});
    }
    return tags;
}

std::vector<std::string> ContentStore::fields(bool ofNumbers) {
    Statement statement(connection_, "SELECT name FROM field WHERE isNumber = ? ORDER BY name");
    std::vector<std::string> names;
    for (statement.bind(1, std::int64_t{ofNumbers}); statement.step();)
        names.emplace_back(statement.bytes(0));
    return names;
}

std::optional<TermId> ContentStore::term(std::string_view value) {
    std::optional<TermId> id;
    if (term_.bind(1, value).step()) id = term_.integer(0);
    term_.reset();
    return id;
}

void ContentStore::forEachTerm(std::string_view start, std::string_view end,
                               const std::function<void(TermId, std::string_view)>& visit) {
    for (terms_.bind(1, start).bind(2, end); terms_.step();) visit(terms_.integer(0), terms_.bytes(1));
    terms_.reset();
}

void ContentStore::addPosting(TermId term, std::int64_t chunk, IdSet& ids) {
    posting_.bind(1, postingKey(term, chunk));
    const bool isIntact = !posting_.step() || ids.insertEncoded(posting_.bytes(0));
    posting_.reset();
    if (!isIntact) {
        throw DatabaseFailure(kErrorMalformed, "the database is damaged: an index entry", connection_.path());
    }
}

Place placeOf(std::string_view path) {
    const std::size_t slash = path.rfind('/');
    if (slash == std::string_view::npos) return {"", path};
    return {path.substr(0, slash == 0 ? 1 : slash), path.substr(slash + 1)};
}

}  // namespace qvct::contentdb
