#include "contentdb/index/DescriberPool.h"

#include "contentdb/terms/Terms.h"
#include "platform/files/FileAccess.h"

#include <exception>
#include <optional>
#include <utility>

namespace qvct::contentdb {
namespace {

/// What is said of the item: without its path, and with the name alone of a file in it or beside it.
std::string failureOf(Error error, const std::string& path) {
    if (!error.isSet()) return "no description";
    const std::string folder = path.substr(0, path.rfind('/') + 1);
    if (error.path == path) {
        error.path.clear();
    } else if (error.path.starts_with(folder)) {
        error.path.erase(0, folder.size());
    }
    return error.message();
}

IndexedItem itemBy(ItemDescriber& describer, const std::string& path) {
    IndexedItem failed;
    try {
        Error error;
        if (auto item = describer.describe(path, &error)) return *std::move(item);
        failed.failure = failureOf(std::move(error), path);
    } catch (...) {
        failed.failure = reasonOfException();
    }
    return failed;
}

}  // namespace

void Described::setSource(const ItemTask& task) {
    item.path = task.path;
    item.stamp = wasAway ? ItemStamp{} : task.stamp;
}

Described describedBy(ItemDescriber& describer, const ItemTask& task) {
    Described described{task.ticket, itemBy(describer, task.path), {}, !fileExists(task.path)};
    described.setSource(task);
    described.terms = termsOf(described.item);
    return described;
}

std::string reasonOfException() {
    std::string reason;
    try {
        throw;
    } catch (const std::exception& fault) {
        reason = fault.what();
    } catch (...) {  // not one of ours, nor of the standard library
    }
    return reason.empty() ? "the describer failed and does not say why" : reason;
}

}  // namespace qvct::contentdb
