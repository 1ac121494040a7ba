#include "contentdb/store/sqlite/Schema.h"

#include "contentdb/store/sqlite/ChecksumVfs.h"
#include "contentdb/store/sqlite/DatabaseFiles.h"
#include "platform/files/FileAccess.h"
#include "platform/files/replacement/FileReplacement.h"

#include <array>
#include <cstdint>
#include <filesystem>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

constexpr std::uint32_t kApplicationId = 0x51564344;  // "QVCD"

/// Step N brings a database of version N to version N + 1. Steps are never changed, only added.
constexpr std::array kMigrations = {
    // Paths and names are blobs, since they need not be UTF-8. Folders have a table of their own, so that one
    // in which nothing has changed can be passed over by its digest alone.
    R"(CREATE TABLE folder (
           id INTEGER PRIMARY KEY,
           path BLOB NOT NULL UNIQUE,
           digest INTEGER NOT NULL,  -- of the names and stamps in it; 0: to be looked at again
           gone INTEGER NOT NULL     -- how many of its items were missing then
       );
       CREATE TABLE item (
           id INTEGER PRIMARY KEY,
           folder INTEGER NOT NULL,
           file BLOB NOT NULL,
           size INTEGER NOT NULL, modified INTEGER NOT NULL, changed INTEGER NOT NULL, inode INTEGER NOT NULL,
           payload BLOB NOT NULL,
           failed INTEGER NOT NULL,
           description BLOB NOT NULL
       );
       CREATE UNIQUE INDEX item_place ON item (folder, file);
       CREATE INDEX item_payload ON item (payload) WHERE length(payload) > 0;
       CREATE INDEX item_failed ON item (id) WHERE failed = 1;
       CREATE TABLE earlier_path (item INTEGER, path BLOB, PRIMARY KEY (item, path)) WITHOUT ROWID;
       -- What items are found by, and for each term and chunk of 65,536 items the items that have it.
       CREATE TABLE term (id INTEGER PRIMARY KEY, value BLOB NOT NULL UNIQUE);
       CREATE TABLE posting (key INTEGER PRIMARY KEY, ids BLOB NOT NULL);
       -- Tags as they are written, and the categories and number fields that a query may name.
       CREATE TABLE tag (term INTEGER PRIMARY KEY, label BLOB NOT NULL, category BLOB NOT NULL);
       CREATE TABLE field (isNumber INTEGER, name BLOB, PRIMARY KEY (isNumber, name)) WITHOUT ROWID;)",
    // Finds the copy with the same inode at once, however many copies there are.
    R"(CREATE TABLE setting (name TEXT PRIMARY KEY, value INTEGER NOT NULL) WITHOUT ROWID;
       DROP INDEX item_payload;
       CREATE INDEX item_payload ON item (payload, inode) WHERE length(payload) > 0;)",
    // A digest covers the items of one part only. Digests from before this step may be out of date, and are
    // dropped.
    R"(ALTER TABLE folder ADD COLUMN part INTEGER NOT NULL DEFAULT 1;
       ALTER TABLE folder ADD COLUMN parts INTEGER NOT NULL DEFAULT 1;
       UPDATE folder SET digest = 0;)",
    // For each cell of the space of sounds and chunk of items, those that lie in the cell, and where.
    "CREATE TABLE likeness (key INTEGER PRIMARY KEY, entries BLOB NOT NULL);"};

[[noreturn]] void refuse(const std::string& path, ErrorCode code, std::string reason) {
    throw DatabaseFailure(code, std::move(reason), path);
}

void migrate(Connection& connection) {
    constexpr auto present = static_cast<std::int64_t>(kMigrations.size());
    Transaction transaction(connection);
    for (std::int64_t version = connection.number("PRAGMA user_version"); version < present; ++version) {
        connection.run(kMigrations[static_cast<std::size_t>(version)]);
        connection.run(fmt::format("PRAGMA user_version = {}", version + 1).c_str());
    }
    transaction.commit();
}

void configure(Connection& connection) {
    connection.run("PRAGMA cell_size_check = ON; PRAGMA temp_store = MEMORY; PRAGMA cache_size = -49152");
}

void keepLog(Connection& connection) {
    if (connection.text("PRAGMA journal_mode = WAL") != "wal")
        refuse(connection.path(), kErrorUnwritable, "no write-ahead log can be kept here");
    connection.run("PRAGMA synchronous = NORMAL; PRAGMA wal_autocheckpoint = 4000");
}

void prepare(Connection& connection, Access access) {
    configure(connection);
    constexpr auto present = static_cast<std::int64_t>(kMigrations.size());
    const std::int64_t version = connection.number("PRAGMA user_version");
    if (connection.number("PRAGMA application_id") != kApplicationId)
        refuse(connection.path(), kErrorInvalidArgument, "not a content database");
    if (version > present) {
        refuse(connection.path(), kErrorInvalidArgument,
               fmt::format("made by a newer version (form {}, known are 1 to {})", version, present));
    }
    if (access == Access::read) {
        if (version < present)
            refuse(connection.path(), kErrorInvalidArgument,
                   "of an older form; indexing brings it up to date");
        return;
    }
    if (version < present) migrate(connection);
    keepLog(connection);
}

bool isEmptyFile(const std::string& path) {
    std::error_code ignored;
    return std::filesystem::file_size(path, ignored) == 0;
}

/// Made beside its place: a reader finds a whole database there, or none.
void create(const std::string& path) {
    const std::string unborn = unfinishedPath(path);
    removeDatabase(unborn);
    makeEmptyLike(path, unborn);
    {
        Connection connection(unborn, Connection::Mode::readWrite);
        configure(connection);
        connection.run(
            fmt::format("PRAGMA page_size = {0}; PRAGMA application_id = {1}", kPageSize, kApplicationId)
                .c_str());
        migrate(connection);
        keepLog(connection);
    }
    Error error;
    if (!renameFlushed(unborn, path, &error)) throw DatabaseFailure(error);
}

std::unique_ptr<Connection> openForReading(const std::string& path) {
    try {
        auto connection = std::make_unique<Connection>(path, Connection::Mode::readOnly);
        prepare(*connection, Access::read);
        return connection;
    } catch (const DatabaseFailure& failure) {
        // In a folder that is not writable, the shared memory of the log cannot be created.
        const bool isOfFolder = failure.code() == kErrorUnreadable || failure.code() == kErrorUnwritable;
        std::error_code ignored;
        const std::string folder = std::filesystem::absolute(path, ignored).parent_path().string();
        if (!isOfFolder || !mayRead(path) || mayWrite(folder)) throw;
    }
    if (fileExists(path + "-wal") && std::filesystem::file_size(path + "-wal") > 0) {
        refuse(path, kErrorUnreadable,
               "its latest changes are only in the log beside it; somebody who may write to its folder "
               "has to open it once");
    }
    auto connection = std::make_unique<Connection>(path, Connection::Mode::unchanging);
    prepare(*connection, Access::read);
    return connection;
}

}  // namespace

std::optional<std::string> reasonAgainstDatabase(const std::string& path) {
    if (isDirectory(path)) return "a folder, not a database";
    if (fileExists(path) && !isRegularFile(path)) return "a pipe or device, not a database";
    return std::nullopt;
}

std::unique_ptr<Connection> openDatabase(const std::string& path, Access access) {
    if (const auto reason = reasonAgainstDatabase(path)) refuse(path, kErrorInvalidArgument, *reason);
    const bool exists = fileExists(path);
    if (!exists && access == Access::read) refuse(path, kErrorUnreadable, "there is no such database");
    if (access == Access::write && (!exists || isEmptyFile(path))) create(path);
    Error error;
    if (!mayRead(path, &error)) throw DatabaseFailure(error);
    if (!isMarkedAsContentDatabase(path)) {
        refuse(path, kErrorInvalidArgument,
               "not a content database, or one whose beginning is damaged; if it was one, move it away and "
               "index again");
    }
    if (access == Access::read) return openForReading(path);
    auto connection = std::make_unique<Connection>(path, Connection::Mode::readWrite);
    prepare(*connection, access);
    return connection;
}

}  // namespace qvct::contentdb
