#include "contentdb/DatabaseFiles.h"

#include "contentdb/Sqlite.h"
#include "platform/FileAccess.h"
#include "platform/Text.h"

#include <filesystem>
#include <system_error>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

std::string rebuiltPath(const std::string& database) {
    return database + ".rebuilt";
}

/// A name beside the database that is not taken yet: the same one until the database itself has it.
std::string nameForDamaged(const std::string& database) {
    std::string name = database + ".damaged";
    for (int i = 2; fileExists(name); ++i) name = fmt::format("{}.damaged-{}", database, i);
    return name;
}

void moveIfThere(const std::string& from, const std::string& to) {
    std::error_code failure;
    if (fileExists(from)) std::filesystem::rename(from, to, failure);
    if (!failure) return;
    throw DatabaseFailure(kErrorUnwritable,
                          fmt::format("{}: cannot be moved: {}", printable(from), failure.message()));
}

}  // namespace

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
    return fileExists(rebuiltPath(database));
}

std::string putAside(const std::string& database) {
    const std::string aside = nameForDamaged(database);
    // The log first, which nobody may take for that of the database to come.
    for (const char* part : {"-shm", "-wal", ""}) moveIfThere(database + part, aside + part);
    moveIfThere(rebuiltPath(database), database);
    return aside;
}

}  // namespace qvct::contentdb
