#include "contentdb/DatabaseFiles.h"

#include "contentdb/Sqlite.h"
#include "platform/FileAccess.h"
#include "platform/FileReplacement.h"

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

/// A name beside the database that is not taken yet: the same one until the database itself has it.
std::string nameForDamaged(const std::string& database) {
    std::string name = database + ".damaged";
    for (int i = 2; fileExists(name); ++i) name = fmt::format("{}.damaged-{}", database, i);
    return name;
}

void moveIfThere(const std::string& from, const std::string& to) {
    Error error;
    if (fileExists(from) && !renameFlushed(from, to, &error))
        throw DatabaseFailure(kErrorUnwritable, error.message);
}

}  // namespace

bool isMarkedAsContentDatabase(const std::string& path) {
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
    const std::string aside = nameForDamaged(database);
    // The log first, which nobody may take for that of the database to come.
    for (const char* part : {"-shm", "-wal", ""}) moveIfThere(database + part, aside + part);
    moveIfThere(rebuiltPath(database), database);
    return aside;
}

}  // namespace qvct::contentdb
