#include "contentdb/store/sqlite/ChecksumVfs.h"

#include <array>
#include <cstdint>
#include <cstring>

#include <sqlite3.h>

namespace qvct::contentdb {
namespace {

sqlite3_vfs* base = nullptr;

/// Ours first, the file of the system's layer right behind it.
struct File {
    sqlite3_file face;

    sqlite3_file* below() { return reinterpret_cast<sqlite3_file*>(this + 1); }
};

File& ours(sqlite3_file* file) {
    return *reinterpret_cast<File*>(file);
}

sqlite3_file* below(sqlite3_file* file) {
    return ours(file).below();
}

/// Each step is one-to-one in the word that it takes in, so no change of a single word goes unseen; the
/// offset is the seed, so that a page in a wrong place is seen as well.
std::uint64_t checksum(const unsigned char* page, sqlite3_int64 offset) {
    std::uint64_t state = static_cast<std::uint64_t>(offset) ^ 0x51776374'64620001U;
    for (int at = 0; at < kPageSize - kChecksumBytes; at += 8) {
        std::uint64_t word = 0;
        std::memcpy(&word, page + at, sizeof word);
        state = (state ^ word) * 0x9e3779b97f4a7c15U;
        state ^= state >> 29U;
    }
    return state;
}

int read(sqlite3_file* file, void* bytes, int count, sqlite3_int64 offset) {
    const int result = below(file)->pMethods->xRead(below(file), bytes, count, offset);
    // SQLite reads parts of the header before it reads pages; whatever they say, pages have our size.
    constexpr int largestPeek = 100;
    if (result != SQLITE_OK || count <= largestPeek) return result;
    if (count != kPageSize || offset % kPageSize != 0) return SQLITE_IOERR_DATA;
    const auto* page = static_cast<const unsigned char*>(bytes);
    const std::uint64_t expected = checksum(page, offset);
    const bool isIntact = std::memcmp(page + kPageSize - kChecksumBytes, &expected, sizeof expected) == 0;
    return isIntact ? SQLITE_OK : SQLITE_IOERR_DATA;
}

int write(sqlite3_file* file, const void* bytes, int count, sqlite3_int64 offset) {
    if (count != kPageSize || offset % kPageSize != 0) return SQLITE_IOERR_WRITE;
    std::array<unsigned char, kPageSize> page{};
    std::memcpy(page.data(), bytes, kPageSize);
    const std::uint64_t sum = checksum(page.data(), offset);
    std::memcpy(page.data() + kPageSize - kChecksumBytes, &sum, sizeof sum);
    return below(file)->pMethods->xWrite(below(file), page.data(), count, offset);
}

const sqlite3_io_methods kMethods = {
    2,  // with shared memory, for the write-ahead log; no mapping, which would bypass the checksums
    [](sqlite3_file* f) { return below(f)->pMethods->xClose(below(f)); },
    read,
    write,
    [](sqlite3_file* f, sqlite3_int64 size) { return below(f)->pMethods->xTruncate(below(f), size); },
    [](sqlite3_file* f, int flags) { return below(f)->pMethods->xSync(below(f), flags); },
    [](sqlite3_file* f, sqlite3_int64* size) { return below(f)->pMethods->xFileSize(below(f), size); },
    [](sqlite3_file* f, int lock) { return below(f)->pMethods->xLock(below(f), lock); },
    [](sqlite3_file* f, int lock) { return below(f)->pMethods->xUnlock(below(f), lock); },
    [](sqlite3_file* f, int* out) { return below(f)->pMethods->xCheckReservedLock(below(f), out); },
    [](sqlite3_file* f, int op, void* arg) { return below(f)->pMethods->xFileControl(below(f), op, arg); },
    [](sqlite3_file* f) { return below(f)->pMethods->xSectorSize(below(f)); },
    [](sqlite3_file* f) { return below(f)->pMethods->xDeviceCharacteristics(below(f)); },
    [](sqlite3_file* f, int region, int size, int extend, void volatile** out) {
        return below(f)->pMethods->xShmMap(below(f), region, size, extend, out);
    },
    [](sqlite3_file* f, int offset, int count, int flags) {
        return below(f)->pMethods->xShmLock(below(f), offset, count, flags);
    },
    [](sqlite3_file* f) { below(f)->pMethods->xShmBarrier(below(f)); },
    [](sqlite3_file* f, int unlink) { return below(f)->pMethods->xShmUnmap(below(f), unlink); },
    nullptr,
    nullptr};

int open(sqlite3_vfs* /*vfs*/, const char* name, sqlite3_file* file, int flags, int* outFlags) {
    // Logs, journals and temporary files go straight to the system.
    if ((flags & SQLITE_OPEN_MAIN_DB) == 0) return base->xOpen(base, name, file, flags, outFlags);
    file->pMethods = nullptr;
    const int result = base->xOpen(base, name, below(file), flags, outFlags);
    if (result == SQLITE_OK) file->pMethods = &kMethods;
    return result;
}

}  // namespace

void registerChecksumVfs() {
    static sqlite3_vfs vfs = [] {
        base = sqlite3_vfs_find(nullptr);
        sqlite3_vfs own = *base;
        own.szOsFile = base->szOsFile + static_cast<int>(sizeof(File));
        own.zName = kChecksumVfs;
        own.xOpen = open;
        own.pNext = nullptr;
        return own;
    }();
    sqlite3_vfs_register(&vfs, 0);
}

}  // namespace qvct::contentdb
