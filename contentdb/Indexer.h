#pragma once

#include "autotagging/services/TaggingServiceNames.h"
#include "contentdb/IndexedItem.h"
#include "formats/library/ContentWalk.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// Where a run is.
struct IndexProgress {
    std::uint64_t seen = 0;       ///< content items that the walk has met
    std::uint64_t unchanged = 0;  ///< of these, passed over because nothing has changed
    std::uint64_t described = 0;  ///< read anew and stored
    std::uint64_t moved = 0;      ///< of these, known before under another path
    std::uint64_t failed = 0;     ///< could not be read; stored with the reason
    std::uint64_t missing = 0;    ///< known to the index, but gone from the disk
    std::uint64_t pruned = 0;     ///< of these, taken out of the index
};

/// A program that describes items by `runIndexWorker`.
struct WorkerProgram {
    /// An absolute path. Empty: our own, `qvct-index-worker`, which describes as `ContentDescriber` does. It
    /// is looked for where the environment variable QVCT_INDEX_WORKER says (absolute, too), beside the
    /// library or program that has this code, and where it is installed, in libexec/qvcontenttagging.
    std::string path;
    /// For a program of the host's own.
    std::vector<std::string> arguments;
};

/// What a run is to do. Only `folders` and `database` have to be given.
struct IndexOptions {
    /// Folders to walk. One that lies in another is walked once.
    std::vector<std::string> folders;
    /// Path of the database; made when there is none.
    std::string database;
    /// A number that identifies what describes items, such as `ContentDescriber::digest`. The database keeps
    /// it; when it differs from the one before, every item counts as changed, even one that only a later run
    /// reaches.
    std::uint64_t describer = 0;
    /// Which links out of a folder are followed, and who is told of the others. Items behind a link that is
    /// no longer followed stay in the index, unless they are indexed under a path of their own.
    WalkedLinks links;
    /// Removes items whose files are gone from the index, except below a folder of `folders` in which nothing
    /// is left: that is what a disk that is not mounted looks like. `failed` is told of it.
    bool prune = false;
    /// With `prune`: removes those as well, and the items of a folder of `folders` that does not exist.
    bool pruneRoots = false;
    /// Reads items again that failed before, though they have not changed.
    bool retryFailed = false;
    /// First reads the whole database, each record and index entry, as `ContentDatabase::check` does;
    /// otherwise only the checksum of every page is checked.
    bool check = false;
    /// Indexes only this part of the items (from 1); `mergeDatabases` unites the parts.
    unsigned part = 1;
    unsigned parts = 1;
    /// How many items are described at a time. 0: as many as there are processors.
    unsigned workers = 0;
    /// What describes them, unless a describer is given.
    WorkerProgram worker;
    /// The tagging services that our own worker program asks, a sum of QVCTAutoTaggingOptions.
    std::uint64_t services = optionsForAllTaggingServices();
    /// Longest that a worker program may take for one item. Time in which the calling thread is elsewhere, as
    /// in a function of this struct, or is stopped, does not count.
    std::chrono::milliseconds timeLimitPerItem{30000};
    /// How long an item that was read may wait to be stored, and so how much work an interruption can lose. A
    /// shorter time makes the run slower.
    std::chrono::milliseconds longestBatch{3000};

    /// Called now and then from the calling thread.
    std::function<void(const IndexProgress&)> progress;
    /// Called for each item or folder that cannot be read, with path and reason.
    std::function<void(const Error&)> failed;
    /// Told when a damaged database was set aside ("<database>.damaged") and rebuilt, from what could still
    /// be read of it and from all the folders that it knew.
    std::function<void(const std::string& message)> note;
    /// Asked after each folder and while items are read; true ends the run early: what was read so far is
    /// stored, and nothing is removed.
    std::function<bool()> isCancelled;
};

/// Brings the database up to date with the folders, making it if there is none.
///
/// An item is read when it is new, when its size, times or inode have changed (or those of the record,
/// description or preview beside it), when something else is rejected for a folder that it lies in, or when
/// another describer described it. Items are read in worker
/// programs: one that crashes its worker, takes too long, or has a description of more than 16 MiB, is stored
/// as failed and costs no other item. The workers are given the files that replace resources here, end with
/// this process, and inherit none of its open files but standard error; what they log is logged here, from
/// the calling thread.
///
/// Batches of items are stored whole or not at all: a run that was interrupted at any point is continued by
/// the next. A new item with the payload of one that is gone is taken to be that item, moved.
///
/// Nothing, and an error, when there is no such folder, the database cannot be written, another run is going
/// on, or the worker program cannot be run. What was stored until then stays.
/// @cost  One reading of the database file, 25 ms for 100,000 items. An unchanged folder: one listing and one
///   look at each file and at what is said of the folder. Memory is bounded whatever the size.
QVCT_API std::optional<IndexProgress> indexLibrary(const IndexOptions& options, Error* error = nullptr);

/// The same in threads of this process, `IndexOptions::workers` of them, each with a describer that the
/// factory makes in it. Nothing protects the process from the describer: an item that crashes it crashes the
/// host, one that hangs it hangs the run, and no time limit applies. Meant for a describer that cannot run in
/// a program of its own, or a host that may not start programs.
QVCT_API std::optional<IndexProgress> indexLibrary(const IndexOptions& options,
                                                   const DescriberFactory& factory, Error* error = nullptr);

/// Unites the databases into a new one, with the content that a single run over everything would have given.
/// Of an item that several have, the first one's is taken. Unless one describer described them all, the next
/// run that names a describer reads every item again. False, and an error, when one cannot be read or
/// `target` exists already; then no new database is left.
QVCT_API bool mergeDatabases(const std::vector<std::string>& databases, const std::string& target,
                             Error* error = nullptr);

}  // namespace qvct::contentdb
