#pragma once

#include "platform/base/Error.h"

#include <cstdint>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>

struct sqlite3;
struct sqlite3_stmt;

namespace qvct::contentdb {

/// What SQLite reports, thrown inside the content database and turned into an Error at its surface.
class DatabaseFailure : public std::runtime_error {
  public:
    explicit DatabaseFailure(Error error) : std::runtime_error(error.message()), error_(std::move(error)) {}
    DatabaseFailure(ErrorCode code, std::string reason, std::string path)
        : DatabaseFailure(errorOf(code, std::move(reason), {std::move(path)})) {}
    /// kErrorMalformed: the file is damaged. kErrorUnwritable: it cannot be written.
    int code() const { return error_.code; }
    const Error& error() const { return error_; }

  private:
    Error error_;
};

/// An open connection. One thread at a time.
class Connection {
  public:
    /// Unchanging: nobody writes to it, so that no log is needed beside it.
    enum class Mode { unchanging, readOnly, readWrite };

    /// @throws DatabaseFailure, as every operation here.
    Connection(const std::string& path, Mode mode);
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;
    ~Connection();

    /// Runs statements that answer nothing.
    void run(const char* sql);
    /// The one number that a statement answers; 0 when it answers none.
    std::int64_t number(const char* sql);
    std::string text(const char* sql);
    /// Reads every page of the file, so that each checksum is checked. Only for a writer, since it moves the
    /// log into the file first. @cost  That of reading the file.
    void checkPages();
    /// Moves the log into the file. Closing does so as well, but does not report a failure.
    void emptyLog();
    [[noreturn]] void fail(std::string_view doing) const;
    const std::string& path() const { return path_; }
    bool isInTransaction() const;
    sqlite3* handle() const { return handle_; }

  private:
    std::string path_;
    sqlite3* handle_ = nullptr;
};

/// A prepared statement: bind from 1, step, read columns from 0, `reset` before the next use.
class Statement {
  public:
    Statement(const Connection& connection, std::string_view sql);
    Statement(const Statement&) = delete;
    Statement& operator=(const Statement&) = delete;
    ~Statement();

    Statement& bind(int index, std::int64_t value);
    Statement& bind(int index, std::uint64_t value) { return bind(index, static_cast<std::int64_t>(value)); }
    /// As a blob: bytes stay what they are. They must live until the statement has run.
    Statement& bind(int index, std::string_view bytes);
    /// Whether there is a row.
    bool step();
    /// Runs a statement that answers nothing and makes it ready for the next use.
    void execute();
    void reset();

    std::int64_t integer(int column) const;
    std::uint64_t unsignedInteger(int column) const { return static_cast<std::uint64_t>(integer(column)); }
    /// Valid until the next step or reset.
    std::string_view bytes(int column) const;

  private:
    const Connection& connection_;
    sqlite3_stmt* statement_ = nullptr;
};

/// All or nothing: rolled back unless committed.
class Transaction {
  public:
    explicit Transaction(Connection& connection);
    Transaction(const Transaction&) = delete;
    Transaction& operator=(const Transaction&) = delete;
    ~Transaction();
    void commit();

  private:
    Connection& connection_;
    bool isOpen_ = true;
};

/// Runs `work` and answers its result; when it throws, the failure becomes the error and `otherwise` the
/// result. The error of a damaged database names the remedy.
template <typename Result, typename Work>
Result guarded(Error* error, Result otherwise, Work work) {
    try {
        return work();
    } catch (const DatabaseFailure& failure) {
        if (error == nullptr) return otherwise;
        *error = failure.error();
        if (failure.code() == kErrorMalformed) error->reason += "; indexing it with `check` builds it anew";
        return otherwise;
    }
}

}  // namespace qvct::contentdb
