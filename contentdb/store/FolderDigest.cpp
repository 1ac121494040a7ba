#include "contentdb/store/FolderDigest.h"

#include "contentdb/store/Digest.h"
#include "contentdb/store/StampNumbers.h"

namespace qvct::contentdb {

std::uint64_t digestOf(const std::vector<ListedItem>& items) {
    Digest digest;
    for (const ListedItem& item : items) {
        digest.add(item.name);
        for (const std::uint64_t number : numbersOf(item.stamp)) digest.add(number);
    }
    return digest.value() == 0 ? 1 : digest.value();
}

}  // namespace qvct::contentdb
