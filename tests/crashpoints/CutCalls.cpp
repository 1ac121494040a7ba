// The functions of the C library that change files, in front of the library's own: a program's symbols are
// found first, also by the libraries that it loads.
#include "CutCalls.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdarg>
#include <mutex>
#include <thread>
#include <utility>

#include <dlfcn.h>
#include <fcntl.h>
#include <fmt/format.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace qvct::test {
namespace {

CutPlan plan;
bool isDiskFull = false;
std::vector<Call> calls;
std::mutex guard;
thread_local bool isOtherProgram = false;

struct Verdict {
    enum Kind { pass, fail, half, halfThenDeath } kind = pass;
    int reason = 0;
};

/// The caller may hold the signal back.
void terminateInAnotherThread() {
    std::thread([] {
        isOtherProgram = true;
        sigset_t termination;
        ::sigemptyset(&termination);
        ::sigaddset(&termination, SIGTERM);
        ::pthread_sigmask(SIG_UNBLOCK, &termination, nullptr);
        ::raise(SIGTERM);
    }).join();
}

Verdict verdictOfPlan(bool canBeHalf) {
    switch (plan.cut) {
        case Cut::none:
            return {};
        case Cut::ioError:
            return {Verdict::fail, EIO};
        case Cut::diskFull:
            return {Verdict::fail, ENOSPC};
        case Cut::interrupted:
            return {Verdict::fail, EINTR};
        case Cut::shortWrite:
            isDiskFull = canBeHalf;
            return {Verdict::half};
        case Cut::death:
            ::_exit(kDiedOfCut);
        case Cut::halfThenDeath:
            return {Verdict::halfThenDeath};
        case Cut::termination:
            terminateInAnotherThread();
    }
    return {};
}

Verdict verdictOnCall(const char* name, std::string path, bool canBeHalf) {
    if (isOtherProgram) return {};
    const std::lock_guard lock(guard);
    const std::uint64_t point = calls.size();
    calls.push_back({name, std::move(path), canBeHalf});
    if (plan.otherProgram && point == plan.interruptedAt) {
        isOtherProgram = true;
        plan.otherProgram();
        isOtherProgram = false;
    }
    if (std::exchange(isDiskFull, false)) return {Verdict::fail, ENOSPC};
    return plan.cut != Cut::none && point == plan.point ? verdictOfPlan(canBeHalf) : Verdict{};
}

bool isOnDisk(int descriptor) {
    struct stat status {};
    return ::fstat(descriptor, &status) == 0 && (S_ISREG(status.st_mode) || S_ISDIR(status.st_mode));
}

std::string pathOf(int descriptor) {
    std::array<char, 4096> path{};
    const ssize_t size =
        ::readlink(fmt::format("/proc/self/fd/{}", descriptor).c_str(), path.data(), path.size());
    return {path.data(), size > 0 ? static_cast<std::size_t>(size) : 0};
}

template <typename Function>
Function next(const char* name) {
    return reinterpret_cast<Function>(::dlsym(RTLD_NEXT, name));
}

/// A call that is done whole or not at all.
template <typename Function>
int whole(const char* name, std::string path, Function call) {
    const Verdict verdict = verdictOnCall(name, std::move(path), false);
    if (verdict.kind == Verdict::pass) return call();
    errno = verdict.reason;
    return -1;
}

template <typename Function>
int wholeOn(int descriptor, const char* name, Function call) {
    return isOnDisk(descriptor) ? whole(name, pathOf(descriptor), call) : call();
}

/// A call that may do a part of what it is asked for.
template <typename Function>
ssize_t partial(int descriptor, const char* name, std::size_t size, Function call) {
    if (!isOnDisk(descriptor)) return call(size);
    const Verdict verdict = verdictOnCall(name, pathOf(descriptor), true);
    if (verdict.kind == Verdict::pass) return call(size);
    if (verdict.kind == Verdict::fail) {
        errno = verdict.reason;
        return -1;
    }
    const ssize_t result = call((size + 1) / 2);
    if (verdict.kind == Verdict::halfThenDeath) ::_exit(kDiedOfCut);
    return result;
}

std::string bothPaths(const char* from, const char* to) {
    return fmt::format("{} > {}", from, to);
}

}  // namespace

void planCut(CutPlan next) {
    const std::lock_guard lock(guard);
    plan = std::move(next);
    isDiskFull = false;
    calls.clear();
}

std::vector<Call> callsMade() {
    const std::lock_guard lock(guard);
    return calls;
}

}  // namespace qvct::test

// NOLINTBEGIN(readability-identifier-naming): their names are the C library's.
#define QVCT_INTERPOSED extern "C" __attribute__((visibility("default")))

using namespace qvct::test;

QVCT_INTERPOSED int open(const char* path, int flags, ...) {
    static const auto real = next<int (*)(const char*, int, ...)>("open");
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    const auto call = [&] { return real(path, flags, mode); };
    return (flags & O_CREAT) != 0 ? whole("open", path, call) : call();
}

QVCT_INTERPOSED int open64(const char* path, int flags, ...) {
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    return open(path, flags, mode);
}

QVCT_INTERPOSED ssize_t write(int descriptor, const void* bytes, size_t size) {
    static const auto real = next<ssize_t (*)(int, const void*, size_t)>("write");
    return partial(descriptor, "write", size, [&](size_t count) { return real(descriptor, bytes, count); });
}

QVCT_INTERPOSED ssize_t pwrite(int descriptor, const void* bytes, size_t size, off_t position) {
    static const auto real = next<ssize_t (*)(int, const void*, size_t, off_t)>("pwrite");
    return partial(descriptor, "pwrite", size,
                   [&](size_t count) { return real(descriptor, bytes, count, position); });
}

QVCT_INTERPOSED ssize_t pwrite64(int descriptor, const void* bytes, size_t size, off64_t position) {
    return pwrite(descriptor, bytes, size, position);
}

QVCT_INTERPOSED ssize_t copy_file_range(int from, off64_t* fromPosition, int to, off64_t* toPosition,
                                        size_t size, unsigned flags) {
    static const auto real =
        next<ssize_t (*)(int, off64_t*, int, off64_t*, size_t, unsigned)>("copy_file_range");
    return partial(to, "copy_file_range", size,
                   [&](size_t count) { return real(from, fromPosition, to, toPosition, count, flags); });
}

QVCT_INTERPOSED int fsync(int descriptor) {
    static const auto real = next<int (*)(int)>("fsync");
    return wholeOn(descriptor, "fsync", [&] { return real(descriptor); });
}

QVCT_INTERPOSED int fdatasync(int descriptor) {
    static const auto real = next<int (*)(int)>("fdatasync");
    return wholeOn(descriptor, "fdatasync", [&] { return real(descriptor); });
}

QVCT_INTERPOSED int ftruncate(int descriptor, off_t size) noexcept {
    static const auto real = next<int (*)(int, off_t)>("ftruncate");
    return wholeOn(descriptor, "ftruncate", [&] { return real(descriptor, size); });
}

QVCT_INTERPOSED int ftruncate64(int descriptor, off64_t size) noexcept {
    return ftruncate(descriptor, size);
}

QVCT_INTERPOSED int fchmod(int descriptor, mode_t mode) noexcept {
    static const auto real = next<int (*)(int, mode_t)>("fchmod");
    return wholeOn(descriptor, "fchmod", [&] { return real(descriptor, mode); });
}

QVCT_INTERPOSED int fchown(int descriptor, uid_t user, gid_t group) noexcept {
    static const auto real = next<int (*)(int, uid_t, gid_t)>("fchown");
    return wholeOn(descriptor, "fchown", [&] { return real(descriptor, user, group); });
}

QVCT_INTERPOSED int fsetxattr(int descriptor, const char* name, const void* value, size_t size,
                              int flags) noexcept {
    static const auto real = next<int (*)(int, const char*, const void*, size_t, int)>("fsetxattr");
    return wholeOn(descriptor, "fsetxattr", [&] { return real(descriptor, name, value, size, flags); });
}

QVCT_INTERPOSED int futimens(int descriptor, const struct timespec times[2]) noexcept {
    static const auto real = next<int (*)(int, const struct timespec*)>("futimens");
    return wholeOn(descriptor, "futimens", [&] { return real(descriptor, times); });
}

QVCT_INTERPOSED int rename(const char* from, const char* to) noexcept {
    static const auto real = next<int (*)(const char*, const char*)>("rename");
    return whole("rename", bothPaths(from, to), [&] { return real(from, to); });
}

QVCT_INTERPOSED int renameat2(int fromFolder, const char* from, int toFolder, const char* to,
                              unsigned flags) noexcept {
    static const auto real = next<int (*)(int, const char*, int, const char*, unsigned)>("renameat2");
    return whole("renameat2", bothPaths(from, to),
                 [&] { return real(fromFolder, from, toFolder, to, flags); });
}

QVCT_INTERPOSED int unlink(const char* path) noexcept {
    static const auto real = next<int (*)(const char*)>("unlink");
    return whole("unlink", path, [&] { return real(path); });
}

QVCT_INTERPOSED int unlinkat(int folder, const char* path, int flags) noexcept {
    static const auto real = next<int (*)(int, const char*, int)>("unlinkat");
    return whole("unlinkat", path, [&] { return real(folder, path, flags); });
}

QVCT_INTERPOSED int flock(int descriptor, int operation) noexcept {
    static const auto real = next<int (*)(int, int)>("flock");
    if (!plan.hasNoLocks) return real(descriptor, operation);
    errno = ENOLCK;
    return -1;
}

QVCT_INTERPOSED time_t time(time_t* result) noexcept {
    static const auto real = next<time_t (*)(time_t*)>("time");
    const time_t now = real(nullptr) + plan.ahead;
    if (result != nullptr) *result = now;
    return now;
}

QVCT_INTERPOSED int mkdir(const char* path, mode_t mode) noexcept {
    static const auto real = next<int (*)(const char*, mode_t)>("mkdir");
    return whole("mkdir", path, [&] { return real(path, mode); });
}
// NOLINTEND(readability-identifier-naming)
