#include "contentdb/IndexedItem.h"

namespace qvct::contentdb {

Error errorOfFailure(const IndexedItem& item) {
    return errorOf(kErrorUnreadable, item.failure, {item.path});
}

}  // namespace qvct::contentdb
