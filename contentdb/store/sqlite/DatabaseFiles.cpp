#include "contentdb/store/sqlite/DatabaseFiles.h"

#include "contentdb/store/sqlite/Sqlite.h"
#include "platform/files/EmptyFile.h"
#include "platform/files/FileAccess.h"
#include "platform/files/replacement/FileReplacement.h"

#include <filesystem>
#include <fstream>
#include <string_view>
#include <system_error>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

std::string rebuiltPath(const std::string& database) {
    return database + ".rebuilt";
}

/// The first bytes of the file, or fewer if it is shorter.
std::string header(const std::string& path) {
    constexpr std::size_t size = 100;
    std::string bytes(size, '\0');
    std::ifstream file(path, std::ios::binary);
    file.read(bytes.data(), size);
    bytes.resize(static_cast<std::size_t>(file.gcount()));
    return bytes;
}

/// The names for damaged databases: the first free one is taken, counting from 1.
std::string nameForDamaged(const std::string& database, int number) {
    return number == 1 ? database + ".damaged" : fmt::format("{}.damaged-{}", database, number);
}

void moveIfThere(const std::string& from, const std::string& to) {
    Error error;
    if (fileExists(from) && !renameFlushed(from, to, &error)) throw DatabaseFailure(error);
}

}  // namespace

std::string pathOfDatabase(const std::string& name) {
    constexpr int kMostLinks = 40;
    // SQLite has a meaning of its own for these.
    std::filesystem::path path = name.starts_with("file:") || name.starts_with(':') ? "./" + name : name;
    std::error_code notThere;
    for (int i = 0; i < kMostLinks && std::filesystem::is_symlink(path, notThere); ++i)
        path = path.parent_path() / std::filesystem::read_symlink(path, notThere);
    return path.string();
}

void makeEmptyLike(const std::string& model, const std::string& path) {
    Error error;
    if (!makeEmptyFileLike(model, path, &error)) throw DatabaseFailure(error);
}

bool isMarkedAsContentDatabase(const std::string& path) {
    if (!isRegularFile(path)) return false;
    constexpr std::string_view magic = "SQLite format 3";
    constexpr std::size_t place = 68;
    const std::string bytes = header(path);
    return bytes.size() > place + 4 && bytes.compare(0, magic.size(), magic) == 0 &&
           bytes.compare(place, 4, "QVCD") == 0;
}

void removeDatabase(const std::string& path) {
    for (const char* part : {"", "-wal", "-shm", "-journal"}) {
        std::error_code ignored;
        std::filesystem::remove(path + part, ignored);
    }
}

std::string unfinishedPath(const std::string& database) {
    return database + ".unfinished";
}

void declareRebuilt(const std::string& database) {
    moveIfThere(unfinishedPath(database), rebuiltPath(database));
}

bool isRebuilt(const std::string& database) {
    return isMarkedAsContentDatabase(rebuiltPath(database));
}

std::string putAside(const std::string& database) {
    int number = 1;
    while (fileExists(nameForDamaged(database, number))) ++number;
    const bool isAside = number > 1 && !fileExists(database);  // by a call that was interrupted
    const std::string aside = nameForDamaged(database, number);
    // The log first, lest it be taken for the log of the new database.
    for (const char* part : {"-shm", "-wal", ""}) moveIfThere(database + part, aside + part);
    moveIfThere(rebuiltPath(database), database);
    return isAside ? nameForDamaged(database, number - 1) : aside;
}

}  // namespace qvct::contentdb
