#include "contentdb/Indexer.h"

#include "contentdb/index/DescriberThreads.h"
#include "contentdb/index/IndexRun.h"
#include "contentdb/index/WorkerPool.h"
#include "contentdb/index/WorkerProgram.h"
#include "contentdb/store/sqlite/DatabaseFiles.h"
#include "contentdb/store/sqlite/RunLock.h"
#include "contentdb/store/sqlite/Schema.h"
#include "contentdb/store/upkeep/Merge.h"
#include "contentdb/store/upkeep/Salvage.h"
#include "contentdb/store/upkeep/StoreCheck.h"
#include "platform/files/FileAccess.h"
#include "platform/files/replacement/FileReplacement.h"
#include "platform/processes/ProcessArguments.h"
#include "platform/text/Text.h"
#include "platform/text/Url.h"

#include <thread>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

using PoolFactory = std::function<std::unique_ptr<DescriberPool>()>;

unsigned numberOfWorkers(const IndexOptions& options) {
    return options.workers != 0 ? options.workers : std::max(1U, std::thread::hardware_concurrency());
}

std::unique_ptr<DescriberPool> workerPool(const IndexOptions& options) {
    constexpr const char* kOfTests = "-XCTest";  // an argument that readers know
    WorkerPool::Settings settings;
    settings.program = pathOfWorkerProgram(options.worker);
    settings.arguments = options.worker.arguments;
    if (options.worker.path.empty()) {
        settings.arguments = {std::to_string(options.services)};
        settings.arguments.insert(settings.arguments.end(), options.folders.begin(), options.folders.end());
    }
    if (processHasArgument(kOfTests)) settings.arguments.emplace_back(kOfTests);
    settings.workers = numberOfWorkers(options);
    settings.timeLimit = options.timeLimitPerItem;
    return std::make_unique<WorkerPool>(std::move(settings));
}

/// Moves a rebuilt database into its place if an earlier run was interrupted before it could.
void finishRebuild(const IndexOptions& options) {
    if (!isRebuilt(options.database)) return;
    const std::string aside = putAside(options.database);
    if (!options.note) return;
    const std::string what = fmt::format(
        "was damaged, and its rebuilding interrupted; the rebuilt one is in its place, the old one was put "
        "aside as {}",
        printable(aside));
    options.note(errorOf(kErrorMalformed, what, {options.database}).message());
}

IndexProgress runOnce(const IndexOptions& options, const std::vector<std::string>& folders,
                      const PoolFactory& makePool) {
    const auto describers = makePool();
    const auto connection = openDatabase(options.database, Access::write);
    connection->checkPages();
    if (options.check) {
        ContentStore store(*connection);
        checkStore(store);
    }
    IndexRun run(options, *connection, *describers);
    bool isInOrder = true;
    for (const std::string& folder : folders) isInOrder = isInOrder && run.walk(folder);
    if (!run.finish() || !isInOrder) throw DatabaseFailure(describers->problem());
    return run.progress();
}

/// Replaces a damaged database by a new one made from what can be read of it and from what its folders hold
/// now. The new one takes its place only when it is complete, so that an interruption loses no folder. False
/// when the run was cancelled.
bool replaceDamaged(const IndexOptions& options, const PoolFactory& makePool,
                    const DatabaseFailure& failure) {
    IndexOptions rebuilding = options;
    rebuilding.prune = false;
    rebuilding.database = unfinishedPath(options.database);
    removeDatabase(rebuilding.database);
    Salvage saved = salvage(options.database, rebuilding.database);
    const bool knowsFolders = !saved.folders.empty();
    std::erase_if(saved.folders, [](const std::string& folder) { return !isDirectory(folder); });
    if (!saved.folders.empty()) {
        runOnce(rebuilding, saved.folders, makePool);
        openDatabase(rebuilding.database, Access::write)->emptyLog();
    }
    if (options.isCancelled && options.isCancelled()) return false;
    declareRebuilt(options.database);
    const std::string aside = putAside(options.database);
    if (options.note) {
        const std::string rest = knowsFolders ? fmt::format(", with {} items that could be read", saved.items)
                                              : "; which other folders were in it could not be read";
        options.note(fmt::format("{}; it was put aside as {} and was built anew{}", failure.what(),
                                 printable(aside), rest));
    }
    return true;
}

std::optional<IndexProgress> indexBy(const PoolFactory& makePool, const IndexOptions& wanted, Error* error) {
    IndexOptions options = wanted;
    options.database = pathOfDatabase(wanted.database);
    const auto refuse = [error](ErrorCode code, std::string reason, std::string path = {}) {
        qvct::fail(error, code, std::move(reason), {std::move(path)});
        return std::nullopt;
    };
    if (options.parts == 0 || options.part == 0 || options.part > options.parts)
        return refuse(kErrorInvalidArgument,
                      fmt::format("there is no part {} of {}", options.part, options.parts));
    std::vector<std::string> folders;
    for (const std::string& folder : options.folders) {
        folders.push_back(URL::fileURLWithPath(folder).path());
        const bool mayBeAway = options.prune && options.pruneRoots && !fileExists(folders.back());
        if (!isDirectory(folders.back()) && !mayBeAway)
            return refuse(kErrorUnreadable, fileExists(folder) ? "is a file, not a folder" : "no such folder",
                          folder);
    }
    if (const auto reason = reasonAgainstDatabase(options.database))
        return refuse(kErrorInvalidArgument, *reason, options.database);
    const auto lock = RunLock::acquire(options.database, error);
    if (!lock) return std::nullopt;
    return guarded(error, std::optional<IndexProgress>(), [&]() -> std::optional<IndexProgress> {
        finishRebuild(options);
        try {
            return runOnce(options, folders, makePool);
        } catch (const DatabaseFailure& failure) {
            const bool isOurs =
                failure.code() == kErrorMalformed && isMarkedAsContentDatabase(options.database);
            if (!isOurs) throw;
            if (!replaceDamaged(options, makePool, failure)) return IndexProgress{};
        }
        return runOnce(options, folders, makePool);
    });
}

}  // namespace

std::optional<IndexProgress> indexLibrary(const IndexOptions& options, Error* error) {
    return indexBy([&] { return workerPool(options); }, options, error);
}

std::optional<IndexProgress> indexLibrary(const IndexOptions& options, const DescriberFactory& factory,
                                          Error* error) {
    if (!factory) {
        qvct::fail(error, kErrorInvalidArgument, "there is nothing that describes items");
        return std::nullopt;
    }
    const auto threads = [&] {
        return std::make_unique<DescriberThreads>(factory, numberOfWorkers(options));
    };
    return indexBy(threads, options, error);
}

bool mergeDatabases(const std::vector<std::string>& databases, const std::string& name, Error* error) {
    const std::string target = pathOfDatabase(name);
    const auto lock = RunLock::acquire(target, error);
    if (!lock) return false;
    if (fileExists(target) || isRebuilt(target))
        return fail(error, kErrorInvalidArgument, "exists already", {target});
    // Built beside its place, so that an interrupted merge leaves no half-finished database there.
    const std::string unfinished = unfinishedPath(target);
    removeDatabase(unfinished);
    const bool isDone = guarded(error, false, [&] {
        mergeInto(unfinished, databases);
        return true;
    });
    if (isDone && renameFlushed(unfinished, target, error)) return true;
    removeDatabase(unfinished);
    return false;
}

}  // namespace qvct::contentdb
