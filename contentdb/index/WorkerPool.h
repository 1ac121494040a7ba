#pragma once

#include "contentdb/IndexedItem.h"

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// A described item, or a failed one, with its index terms.
struct Described {
    std::uint64_t ticket = 0;
    IndexedItem item;
    std::vector<std::string> terms;
};

/// Describes items in processes of their own, so that an item that crashes or hangs its describer costs that
/// process only: it is ended and replaced, and the item comes back as failed.
///
/// The processes are forked. A host with threads of its own must see to it that none of them holds a lock
/// that the describer needs at that moment. They end with the pool, and with the process that has it.
class WorkerPool {
  public:
    struct Settings {
        unsigned workers = 1;
        /// Longest that one item may take.
        std::chrono::milliseconds timeLimit{30000};
    };

    WorkerPool(DescriberFactory factory, Settings settings);
    WorkerPool(const WorkerPool&) = delete;
    WorkerPool& operator=(const WorkerPool&) = delete;
    ~WorkerPool();

    /// Whether another item can be taken without more memory than a bounded queue.
    bool hasRoom() const;
    /// Hands out the item at the path. The stamp becomes part of what comes back.
    void submit(std::uint64_t ticket, std::string path, const ItemStamp& stamp);
    /// Whether items are on their way.
    bool isBusy() const;
    /// Waits a little for what is ready and calls `take` for each, in any order. Whether the pool is in
    /// order: false when workers die before they have described anything.
    bool collect(const std::function<void(Described)>& take);

  private:
    struct Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace qvct::contentdb
