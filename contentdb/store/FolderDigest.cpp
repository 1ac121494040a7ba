#include "contentdb/store/FolderDigest.h"

#include "contentdb/store/Digest.h"

namespace qvct::contentdb {

std::uint64_t digestOf(const std::vector<ListedItem>& items) {
    Digest digest;
    for (const ListedItem& item : items) {
        digest.add(item.name);
        digest.add(item.stamp.size);
        digest.add(static_cast<std::uint64_t>(item.stamp.modified));
        digest.add(static_cast<std::uint64_t>(item.stamp.changed));
        digest.add(item.stamp.inode);
    }
    return digest.value() == 0 ? 1 : digest.value();
}

}  // namespace qvct::contentdb
