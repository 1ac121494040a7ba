#include "contentdb/Indexer.h"

#include "contentdb/DatabaseFiles.h"
#include "contentdb/IndexRun.h"
#include "contentdb/RunLock.h"
#include "contentdb/Salvage.h"
#include "contentdb/Schema.h"
#include "platform/FileAccess.h"
#include "platform/Text.h"
#include "platform/Url.h"

#include <thread>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

/// Puts a damaged database aside and what can be read of it into its place. Answers the folders that may have
/// lost items.
std::vector<std::string> replaceDamaged(const IndexOptions& options, const DatabaseFailure& failure) {
    const std::string unfinished = unfinishedPath(options.database);
    removeDatabase(unfinished);
    Salvage saved = salvage(options.database, unfinished);
    declareRebuilt(options.database);
    const std::string aside = putAside(options.database);
    if (options.note) {
        const std::string rest = saved.folders.empty()
                                     ? "; which other folders were in it could not be read"
                                     : fmt::format(", with {} items that could be read", saved.items);
        options.note(fmt::format("{}; it was put aside as {} and is built anew{}", failure.what(),
                                 printable(aside), rest));
    }
    std::erase_if(saved.folders, [](const std::string& folder) { return !isDirectory(folder); });
    return std::move(saved.folders);
}

/// Puts a database that an earlier run has rebuilt, but not into its place, there.
void finishRebuild(const IndexOptions& options) {
    if (!isRebuilt(options.database)) return;
    const std::string aside = putAside(options.database);
    if (!options.note) return;
    options.note(fmt::format(
        "{}: was damaged, and its rebuilding interrupted; the old one was put aside as {}, its other "
        "folders are to be indexed again",
        printable(options.database), printable(aside)));
}

IndexProgress runOnce(const IndexOptions& options, const std::vector<std::string>& folders,
                      const DescriberFactory& factory) {
    const unsigned processors = std::max(1U, std::thread::hardware_concurrency());
    WorkerPool workers(factory,
                       {options.workers != 0 ? options.workers : processors, options.timeLimitPerItem});
    const auto connection = openDatabase(options.database, Access::write);
    connection->checkPages();
    if (options.check) ContentStore(*connection).checkAll();
    IndexRun run(options, *connection, workers);
    bool isInOrder = true;
    for (const std::string& folder : folders) isInOrder = isInOrder && run.walk(folder);
    if (!run.finish() || !isInOrder)
        throw DatabaseFailure(kErrorUnreadable, "the processes that read items cannot be kept running");
    return run.progress();
}

}  // namespace

std::optional<IndexProgress> indexLibrary(const IndexOptions& options, const DescriberFactory& factory,
                                          Error* error) {
    const auto refuse = [error](ErrorCode code, const std::string& message) {
        qvct::fail(error, code, message);
        return std::nullopt;
    };
    if (options.parts == 0 || options.part == 0 || options.part > options.parts)
        return refuse(kErrorInvalidArgument,
                      fmt::format("there is no part {} of {}", options.part, options.parts));
    if (!factory) return refuse(kErrorInvalidArgument, "there is nothing that describes items");
    std::vector<std::string> folders;
    for (const std::string& folder : options.folders) {
        folders.push_back(URL::fileURLWithPath(folder).path());
        const bool mayBeAway = options.prune && options.pruneRoots && !fileExists(folders.back());
        if (!isDirectory(folders.back()) && !mayBeAway)
            return refuse(kErrorUnreadable,
                          fmt::format("{}: {}", printable(folder),
                                      fileExists(folder) ? "is a file, not a folder" : "no such folder"));
    }
    if (const auto reason = reasonAgainstDatabase(options.database))
        return refuse(kErrorInvalidArgument, fmt::format("{}: {}", printable(options.database), *reason));
    const auto lock = RunLock::acquire(options.database, error);
    if (!lock) return std::nullopt;
    return guarded(error, std::optional<IndexProgress>(), [&]() -> std::optional<IndexProgress> {
        finishRebuild(options);
        try {
            return runOnce(options, folders, factory);
        } catch (const DatabaseFailure& failure) {
            const bool isOurs =
                failure.code() == kErrorMalformed && isMarkedAsContentDatabase(options.database);
            if (!isOurs) throw;
            IndexOptions others = options;
            others.prune = false;
            others.folders = replaceDamaged(options, failure);
            if (!others.folders.empty()) runOnce(others, others.folders, factory);
        }
        return runOnce(options, folders, factory);
    });
}

}  // namespace qvct::contentdb
