#include "contentdb/IndexedItem.h"

#include "platform/text/Text.h"

namespace qvct::contentdb {

std::string messageOfFailure(const IndexedItem& item) {
    const std::string path = printable(item.path);
    const std::string reason = printable(item.failure);
    // Most reasons name the file themselves.
    return reason.find(path) != std::string::npos ? reason : path + ": " + reason;
}

}  // namespace qvct::contentdb
