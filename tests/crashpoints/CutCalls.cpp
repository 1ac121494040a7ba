// The functions of the C library that change files, in front of the library's own: a program's symbols are
// found first, also by the libraries that it loads.
#include "CutCalls.h"

#include <cerrno>
#include <mutex>
#include <utility>

#include <dlfcn.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct::test {
namespace {

Cut planned = Cut::none;
std::uint64_t plannedPoint = 0;
bool isDiskFull = false;
std::vector<bool> calls;
std::mutex guard;

enum class Verdict { pass, fail, half, passThenDie };

Verdict verdictOnCall(bool canBeHalf) {
    const std::lock_guard lock(guard);
    const std::uint64_t point = calls.size();
    calls.push_back(canBeHalf);
    if (std::exchange(isDiskFull, false)) return Verdict::fail;
    if (planned == Cut::none || point != plannedPoint) return Verdict::pass;
    if (planned == Cut::deathBefore) ::_exit(kDiedOfCut);
    if (planned == Cut::deathAfter) return Verdict::passThenDie;
    if (planned == Cut::error) return Verdict::fail;
    isDiskFull = canBeHalf;
    return canBeHalf ? Verdict::half : Verdict::fail;
}

bool isOnDisk(int descriptor) {
    struct stat status {};
    return ::fstat(descriptor, &status) == 0 && (S_ISREG(status.st_mode) || S_ISDIR(status.st_mode));
}

template <typename Function>
Function next(const char* name) {
    return reinterpret_cast<Function>(::dlsym(RTLD_NEXT, name));
}

/// A call that is done whole or not at all.
template <typename Call>
int whole(Call call) {
    const Verdict verdict = verdictOnCall(false);
    if (verdict == Verdict::fail) {
        errno = EIO;
        return -1;
    }
    const int result = call();
    if (verdict == Verdict::passThenDie) ::_exit(kDiedOfCut);
    return result;
}

/// A call that may do a part of what it is asked for.
template <typename Call>
ssize_t partial(int descriptor, std::size_t size, Call call) {
    if (!isOnDisk(descriptor)) return call(size);
    const Verdict verdict = verdictOnCall(true);
    if (verdict == Verdict::fail) {
        errno = ENOSPC;
        return -1;
    }
    if (verdict == Verdict::half) return call((size + 1) / 2);
    const ssize_t result = call(size);
    if (verdict == Verdict::passThenDie) ::_exit(kDiedOfCut);
    return result;
}

}  // namespace

void cutCall(Cut cut, std::uint64_t point) {
    const std::lock_guard lock(guard);
    planned = cut;
    plannedPoint = point;
    isDiskFull = false;
    calls.clear();
}

std::vector<bool> callsMade() {
    const std::lock_guard lock(guard);
    return calls;
}

}  // namespace qvct::test

// NOLINTBEGIN(readability-identifier-naming): their names are the C library's.
#define QVCT_INTERPOSED extern "C" __attribute__((visibility("default")))

using namespace qvct::test;

QVCT_INTERPOSED ssize_t write(int descriptor, const void* bytes, size_t size) {
    static const auto real = next<ssize_t (*)(int, const void*, size_t)>("write");
    return partial(descriptor, size, [&](size_t count) { return real(descriptor, bytes, count); });
}

QVCT_INTERPOSED ssize_t pwrite(int descriptor, const void* bytes, size_t size, off_t position) {
    static const auto real = next<ssize_t (*)(int, const void*, size_t, off_t)>("pwrite");
    return partial(descriptor, size, [&](size_t count) { return real(descriptor, bytes, count, position); });
}

QVCT_INTERPOSED ssize_t pwrite64(int descriptor, const void* bytes, size_t size, off64_t position) {
    return pwrite(descriptor, bytes, size, position);
}

QVCT_INTERPOSED ssize_t copy_file_range(int from, off64_t* fromPosition, int to, off64_t* toPosition,
                                        size_t size, unsigned flags) {
    static const auto real =
        next<ssize_t (*)(int, off64_t*, int, off64_t*, size_t, unsigned)>("copy_file_range");
    return partial(to, size,
                   [&](size_t count) { return real(from, fromPosition, to, toPosition, count, flags); });
}

QVCT_INTERPOSED int fsync(int descriptor) {
    static const auto real = next<int (*)(int)>("fsync");
    return whole([&] { return real(descriptor); });
}

QVCT_INTERPOSED int fdatasync(int descriptor) {
    static const auto real = next<int (*)(int)>("fdatasync");
    return whole([&] { return real(descriptor); });
}

QVCT_INTERPOSED int ftruncate(int descriptor, off_t size) noexcept {
    static const auto real = next<int (*)(int, off_t)>("ftruncate");
    return whole([&] { return real(descriptor, size); });
}

QVCT_INTERPOSED int ftruncate64(int descriptor, off64_t size) noexcept {
    return ftruncate(descriptor, size);
}

QVCT_INTERPOSED int rename(const char* from, const char* to) noexcept {
    static const auto real = next<int (*)(const char*, const char*)>("rename");
    return whole([&] { return real(from, to); });
}

QVCT_INTERPOSED int unlink(const char* path) noexcept {
    static const auto real = next<int (*)(const char*)>("unlink");
    return whole([&] { return real(path); });
}
// NOLINTEND(readability-identifier-naming)
