#include "contentdb/index/DescriberPool.h"

#include "contentdb/terms/Terms.h"
#include "platform/files/FileAccess.h"

#include <exception>
#include <optional>
#include <utility>

namespace qvct::contentdb {
namespace {

IndexedItem itemBy(ItemDescriber& describer, const std::string& path) {
    IndexedItem failed;
    try {
        Error error;
        if (auto item = describer.describe(path, &error)) return *std::move(item);
        failed.failure = error.message.empty() ? "no description" : error.message;
    } catch (const std::exception& fault) {
        failed.failure = fault.what();
    } catch (...) {
        failed.failure = "reading it failed for a reason that cannot be told";
    }
    return failed;
}

}  // namespace

Described describedBy(ItemDescriber& describer, const ItemTask& task) {
    Described described{task.ticket, itemBy(describer, task.path), {}};
    described.item.path = task.path;
    // The file is gone, perhaps only for a moment: what was read may be incomplete, and a failure may not be
    // the item's fault.
    described.item.stamp = fileExists(task.path) ? task.stamp : ItemStamp{};
    described.terms = termsOf(described.item);
    return described;
}

}  // namespace qvct::contentdb
