#include "contentdb/store/sqlite/Sqlite.h"

#include "contentdb/store/sqlite/ChecksumVfs.h"

#include <array>
#include <filesystem>

#include <fmt/format.h>
#include <sqlite3.h>

namespace qvct::contentdb {
namespace {

ErrorCode codeOf(int result) {
    switch (result & 0xff) {
        case SQLITE_CORRUPT:
        case SQLITE_NOTADB:
        case SQLITE_FORMAT:
            return kErrorMalformed;
        case SQLITE_IOERR:
            return result == SQLITE_IOERR_DATA || result == SQLITE_IOERR_SHORT_READ ? kErrorMalformed
                                                                                    : kErrorUnwritable;
        case SQLITE_CANTOPEN:
            return kErrorUnreadable;
        case SQLITE_TOOBIG:
            return kErrorTooLarge;
        default:
            return kErrorUnwritable;
    }
}

std::string_view reasonOf(int result, std::string_view otherwise) {
    if (result == SQLITE_IOERR_DATA) return "the database is damaged: a page does not match its checksum";
    if (result == SQLITE_IOERR_SHORT_READ) return "the database is damaged: its end is missing";
    if ((result & 0xff) == SQLITE_CORRUPT) return "the database is damaged";
    if ((result & 0xff) == SQLITE_NOTADB) return "not a content database, or a damaged one";
    if ((result & 0xff) == SQLITE_BUSY) return "another process is writing to the database";
    return otherwise;
}

/// The file by an URI that says that nobody writes to it.
std::string unchangingUri(const std::string& path) {
    std::string uri = "file:";
    for (const char c : std::filesystem::absolute(path).string())
        uri += fmt::format("%{:02X}", static_cast<unsigned char>(c));
    return uri + "?immutable=1";
}

}  // namespace

Connection::Connection(const std::string& path, Mode mode) : path_(path) {
    registerChecksumVfs();
    constexpr int patience = 10000;  // milliseconds that a writer waits for another
    const int flags = mode == Mode::readWrite ? SQLITE_OPEN_READWRITE : SQLITE_OPEN_READONLY;
    const std::string name = mode == Mode::unchanging ? unchangingUri(path) : path;
    if (sqlite3_open_v2(name.c_str(), &handle_, flags | SQLITE_OPEN_NOMUTEX, kChecksumVfs) != SQLITE_OK) {
        const int result = sqlite3_extended_errcode(handle_);
        std::string reason(reasonOf(result, sqlite3_errmsg(handle_)));
        sqlite3_close(handle_);
        throw DatabaseFailure(codeOf(result), std::move(reason), path);
    }
    sqlite3_extended_result_codes(handle_, 1);
    sqlite3_busy_timeout(handle_, patience);
    sqlite3_db_config(handle_, SQLITE_DBCONFIG_DEFENSIVE, 1, nullptr);
    sqlite3_db_config(handle_, SQLITE_DBCONFIG_TRUSTED_SCHEMA, 0, nullptr);
    sqlite3_db_config(handle_, SQLITE_DBCONFIG_ENABLE_LOAD_EXTENSION, 0, nullptr);
    int reserved = kChecksumBytes;
    sqlite3_file_control(handle_, "main", SQLITE_FCNTL_RESERVE_BYTES, &reserved);
}

Connection::~Connection() {
    sqlite3_close(handle_);
}

void Connection::run(const char* sql) {
    if (sqlite3_exec(handle_, sql, nullptr, nullptr, nullptr) != SQLITE_OK) fail(sql);
}

std::int64_t Connection::number(const char* sql) {
    Statement statement(*this, sql);
    return statement.step() ? statement.integer(0) : 0;
}

std::string Connection::text(const char* sql) {
    Statement statement(*this, sql);
    return statement.step() ? std::string(statement.bytes(0)) : std::string();
}

void Connection::checkPages() {
    // A page that a power failure left half written is still whole in the log.
    run("PRAGMA wal_checkpoint(PASSIVE)");
    sqlite3_file* file = nullptr;
    sqlite3_file_control(handle_, "main", SQLITE_FCNTL_FILE_POINTER, &file);
    std::array<char, kPageSize> page{};
    sqlite3_int64 size = 0;
    int result = file->pMethods->xFileSize(file, &size);
    for (sqlite3_int64 at = 0; result == SQLITE_OK && at < size; at += kPageSize)
        result = file->pMethods->xRead(file, page.data(), kPageSize, at);
    if (result == SQLITE_OK) return;
    throw DatabaseFailure(codeOf(result), std::string(reasonOf(result, sqlite3_errstr(result))), path_);
}

void Connection::emptyLog() {
    if (number("PRAGMA wal_checkpoint(TRUNCATE)") != 0) fail("cannot write the log into the file");
}

bool Connection::isInTransaction() const {
    return sqlite3_get_autocommit(handle_) == 0;
}

void Connection::fail(std::string_view doing) const {
    const int result = sqlite3_extended_errcode(handle_);
    std::string reason(reasonOf(result, sqlite3_errmsg(handle_)));
    if ((result & 0xff) == SQLITE_ERROR) reason += fmt::format(" ({})", doing);
    throw DatabaseFailure(codeOf(result), std::move(reason), path_);
}

Statement::Statement(const Connection& connection, std::string_view sql) : connection_(connection) {
    if (sqlite3_prepare_v3(connection.handle(), sql.data(), static_cast<int>(sql.size()),
                           SQLITE_PREPARE_PERSISTENT, &statement_, nullptr) != SQLITE_OK) {
        connection.fail(sql);
    }
}

Statement::~Statement() {
    sqlite3_finalize(statement_);
}

Statement& Statement::bind(int index, std::int64_t value) {
    if (sqlite3_bind_int64(statement_, index, value) != SQLITE_OK) connection_.fail("binding a number");
    return *this;
}

Statement& Statement::bind(int index, std::string_view bytes) {
    const char* start = bytes.empty() ? "" : bytes.data();
    if (sqlite3_bind_blob64(statement_, index, start, bytes.size(), SQLITE_STATIC) != SQLITE_OK) {
        connection_.fail("binding bytes");
    }
    return *this;
}

bool Statement::step() {
    const int result = sqlite3_step(statement_);
    if (result != SQLITE_ROW && result != SQLITE_DONE) connection_.fail(sqlite3_sql(statement_));
    return result == SQLITE_ROW;
}

void Statement::execute() {
    step();
    reset();
}

void Statement::reset() {
    sqlite3_reset(statement_);
}

std::int64_t Statement::integer(int column) const {
    return sqlite3_column_int64(statement_, column);
}

std::string_view Statement::bytes(int column) const {
    const void* start = sqlite3_column_blob(statement_, column);
    const auto size = static_cast<std::size_t>(sqlite3_column_bytes(statement_, column));
    return start == nullptr ? std::string_view() : std::string_view(static_cast<const char*>(start), size);
}

Transaction::Transaction(Connection& connection) : connection_(connection) {
    connection_.run("BEGIN IMMEDIATE");
}

Transaction::~Transaction() {
    // A failed statement may have rolled back already; there is nothing more to do then.
    if (isOpen_) sqlite3_exec(connection_.handle(), "ROLLBACK", nullptr, nullptr, nullptr);
}

void Transaction::commit() {
    connection_.run("COMMIT");
    isOpen_ = false;
}

}  // namespace qvct::contentdb
