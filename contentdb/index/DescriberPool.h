#pragma once

#include "contentdb/IndexedItem.h"

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// An item that is to be described. Later ones have higher tickets.
struct ItemTask {
    std::uint64_t ticket = 0;
    std::string path;
    ItemStamp stamp;
};

/// A described item, or a failed one, with its index terms.
struct Described {
    std::uint64_t ticket = 0;
    IndexedItem item;
    std::vector<std::string> terms;
    /// The file was gone afterwards, perhaps only for a moment: what was read may be incomplete, and a
    /// failure may not be the item's fault.
    bool wasAway = false;

    /// Sets path and stamp: none for a file that was away, so that the next run reads it again.
    void setSource(const ItemTask& task);
};

/// The item as the describer describes it; a failed item if it cannot.
Described describedBy(ItemDescriber& describer, const ItemTask& task);

/// What the exception that was just caught says; never empty.
std::string reasonOfException();

/// Workers that describe the items of a run, several at a time.
class DescriberPool {
  public:
    virtual ~DescriberPool() = default;

    /// Whether another item can be taken without more memory than a bounded queue.
    virtual bool hasRoom() const = 0;
    virtual void submit(ItemTask task) = 0;
    /// Whether items are on their way.
    virtual bool isBusy() const = 0;
    /// Waits briefly for described items and calls `take` for each that is ready, in any order. False when
    /// nothing can be described any more; `problem` then says why, and what was ready has been given out.
    virtual bool collect(const std::function<void(Described)>& take) = 0;
    virtual Error problem() const = 0;
};

}  // namespace qvct::contentdb
