#pragma once

#include "autotagging/services/TaggingServiceNames.h"
#include "contentdb/IndexedItem.h"
#include "formats/ContentWalk.h"
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
    /// Empty: our own, `qvct-index-worker`, which describes as `ContentDescriber` does. It is looked for
    /// where the environment variable QVCT_INDEX_WORKER says, beside the library or program that has this
    /// code, and where it is installed, in libexec/qvcontenttagging.
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
    /// A number for what describes items, such as `ContentDescriber::digest`. The database keeps it; when it
    /// is another than before, every item counts as changed, also those that only a later run comes to.
    std::uint64_t describer = 0;
    /// Which links out of a folder are followed, and who is told of the others. A link that is passed over
    /// takes nothing out of the index, unless what it leads to is indexed under a path of its own.
    WalkedLinks links;
    /// Takes items out of the index whose files are gone, but for those below a folder of `folders` in which
    /// nothing is left: a disk that is away looks like this. `failed` is told of it.
    bool prune = false;
    /// With `prune`: takes those out as well, and those of a folder of `folders` that is not there.
    bool pruneRoots = false;
    /// Reads items again that failed before, though they have not changed.
    bool retryFailed = false;
    /// Reads the database whole before, each record and index entry, as `ContentDatabase::check` does;
    /// without, every page is held against its checksum.
    bool check = false;
    /// Takes only this part of the items (from 1), to be united with the others by `mergeDatabases`.
    unsigned part = 1;
    unsigned parts = 1;
    /// How many items are described at a time. 0: as many as there are processors.
    unsigned workers = 0;
    /// What describes them, unless a describer is given.
    WorkerProgram worker;
    /// The tagging services that our own worker program asks, a sum of QVCTAutoTaggingOptions.
    std::uint64_t services = optionsForAllTaggingServices();
    /// Longest that a worker program may take for one item.
    std::chrono::milliseconds timeLimitPerItem{30000};
    /// Longest that an item waits, once read, until it is stored: what an interruption may cost. Shorter
    /// costs speed.
    std::chrono::milliseconds longestBatch{3000};

    /// Called now and then from the calling thread.
    std::function<void(const IndexProgress&)> progress;
    /// Called for each item or folder that cannot be read, with path and reason.
    std::function<void(const Error&)> failed;
    /// Told when a damaged database was put aside ("<database>.damaged") and built anew, from what can still
    /// be read of it and from all folders that are known to it.
    std::function<void(const std::string& message)> note;
    /// Asked after each folder and while items are read; true ends the run early, with all that was read so
    /// far stored and nothing taken out.
    std::function<bool()> isCancelled;
};

/// Brings the database up to date with the folders, making it if there is none.
///
/// Only items that are new, whose size, times or inode have changed (or those of what lies beside them:
/// record, description, preview), or that another describer has described are read, each in the process of a
/// worker program: one that crashes it, or takes too long, has failed, and costs no other item. The programs
/// are started with what replaces resources here, end with this process, and have none of its open files but
/// standard error; what they log is logged here, from the calling thread.
///
/// Batches of items are stored whole or not at all: a run that was interrupted at any point is continued by
/// the next. An item with the payload of one that is gone is that item, moved.
///
/// Nothing, and an error, when there is no such folder, the database cannot be written, another run is going
/// on, or the worker program cannot be run. What was stored until then stays.
/// @cost  One reading of the database file, 25 ms for 100,000 items. An unchanged folder: one listing and one
///   look at each file. Memory is bounded whatever the size.
QVCT_API std::optional<IndexProgress> indexLibrary(const IndexOptions& options, Error* error = nullptr);

/// The same in threads of this process, `IndexOptions::workers` of them, each with a describer that the
/// factory makes in it. Nothing protects the process from what describes: an item that crashes it crashes the
/// host, one that hangs it hangs the run, and no time limit holds. For a describer that cannot be in a
/// program of its own, or a host that may start none.
QVCT_API std::optional<IndexProgress> indexLibrary(const IndexOptions& options,
                                                   const DescriberFactory& factory, Error* error = nullptr);

/// Unites the databases into a new one with the content that one run over everything would have made. The
/// first database that has an item counts. Unless one describer described them all, the next run with one
/// reads every item again.
/// False, and an error, when one cannot be read or `target` exists already; then no new database is left.
QVCT_API bool mergeDatabases(const std::vector<std::string>& databases, const std::string& target,
                             Error* error = nullptr);

}  // namespace qvct::contentdb
