#include "platform/files/replacement/UnfinishedFile.h"

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <charconv>
#include <chrono>
#include <climits>
#include <ctime>
#include <memory>
#include <mutex>
#include <optional>
#include <string_view>
#include <vector>

#include <dirent.h>
#include <fcntl.h>
#include <fmt/format.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct {
namespace {

constexpr std::string_view kPrefix = ".qvct-";
constexpr std::string_view kSuffix = ".tmp";

/// The paths of this process's unfinished files, where a signal handler can read them.
struct Slot {
    enum State { free, changing, used, removing };
    std::atomic<int> state = free;
    std::atomic<pid_t> owner = 0;  // tells this process from one forked from it
    std::array<char, PATH_MAX> path{};
};
std::array<Slot, 16> slots;

constexpr std::array kEndingSignals = {SIGINT, SIGTERM, SIGHUP};

/// Raises the signal again, which ends the process when this returns. Until then other threads go on.
void removeUnfinishedFilesAndEnd(int signal) {
    for (Slot& slot : slots) {
        int expected = Slot::used;
        if (slot.owner != ::getpid()) continue;
        if (slot.state.compare_exchange_strong(expected, Slot::removing)) ::unlink(slot.path.data());
    }
    ::raise(signal);
}

/// Reserves a free slot and answers its number; one past the last when there is none.
std::size_t takeSlot() {
    for (std::size_t i = 0; i < slots.size(); ++i) {
        int expected = Slot::free;
        if (slots[i].state.compare_exchange_strong(expected, Slot::changing)) return i;
    }
    return slots.size();
}

void setSlot(std::size_t slot, const std::string& path) {
    if (slot >= slots.size() || path.size() >= PATH_MAX) return;
    std::copy_n(path.c_str(), path.size() + 1, slots[slot].path.data());
    slots[slot].owner = ::getpid();
    slots[slot].state = Slot::used;
}

void freeSlot(std::size_t slot) {
    if (slot >= slots.size()) return;
    int state = slots[slot].state;
    if (state != Slot::removing) slots[slot].state.compare_exchange_strong(state, Slot::free);
}

/// FNV-1a hash of a stamp, by which file names refer to it.
std::uint64_t markOf(const FileStamp& stamp) {
    std::uint64_t hash = 0xcbf29ce484222325U;
    for (std::uint64_t value :
         {stamp.device, stamp.inode, stamp.size, static_cast<std::uint64_t>(stamp.modifiedNanoseconds)}) {
        for (int i = 0; i < 8; ++i, value >>= 8U) hash = (hash ^ (value & 0xFFU)) * 0x100000001b3U;
    }
    return hash;
}

/// The numbers in the name of an unfinished file: process, number and, when it was about to be exchanged, the
/// marks of the two files. Nothing for any other name.
std::optional<std::vector<std::uint64_t>> numbersIn(std::string_view name) {
    if (!name.starts_with(kPrefix) || !name.ends_with(kSuffix)) return std::nullopt;
    name.remove_prefix(kPrefix.size());
    std::vector<std::uint64_t> numbers;
    for (;;) {
        std::uint64_t number = 0;
        const auto [end, fault] =
            std::from_chars(name.data(), name.data() + name.size(), number, numbers.size() < 2 ? 10 : 16);
        if (fault != std::errc()) return std::nullopt;
        numbers.push_back(number);
        name.remove_prefix(static_cast<std::size_t>(end - name.data()));
        if (name == kSuffix) break;
        if (!name.starts_with('-')) return std::nullopt;
        name.remove_prefix(1);
    }
    return numbers.size() == 2 || numbers.size() == 4 ? std::optional(numbers) : std::nullopt;
}

bool isOwnerGone(int file, const struct stat& status) {
    if (::flock(file, LOCK_EX | LOCK_NB) == 0) return true;
    constexpr std::time_t kDay = std::time_t{24} * 60 * 60;
    return errno != EWOULDBLOCK && status.st_ctim.tv_sec + kDay < std::time(nullptr);
}

void removeIfLeft(int folder, const char* name) {
    const auto numbers = numbersIn(name);
    if (!numbers) return;
    const FileDescriptor file(::openat(folder, name, O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    struct stat status {};
    if (!file.isOpen() || ::fstat(file.number(), &status) != 0 || !S_ISREG(status.st_mode)) return;
    if (status.st_uid != ::geteuid() || !isOwnerGone(file.number(), status)) return;
    struct stat named {};
    if (::fstatat(folder, name, &named, AT_SYMLINK_NOFOLLOW) != 0 || named.st_dev != status.st_dev ||
        named.st_ino != status.st_ino) {
        return;
    }
    const std::uint64_t mark = markOf(FileStamp::of(named));
    const bool isKnown = numbers->size() == 2 || mark == (*numbers)[2] || mark == (*numbers)[3];
    if (isKnown) ::unlinkat(folder, name, 0);
}

/// Whether this folder was the last to be searched, less than a second ago.
bool isLookedThrough(const std::string& folder) {
    using Clock = std::chrono::steady_clock;
    static std::mutex guard;
    static std::string last;
    static Clock::time_point when;
    const std::lock_guard lock(guard);
    const auto now = Clock::now();
    if (folder == last && now - when < std::chrono::seconds(1)) return true;
    last = folder;
    when = now;
    return false;
}

}  // namespace

UnfinishedFile::UnfinishedFile(const std::string& folder, mode_t mode)
    : folder_(folder), owner_(::getpid()), slot_(takeSlot()) {
    const EndingSignalsHeld held;
    for (int attempt = 0; attempt < 100; ++attempt) {
        if (make(fmt::format("{}{}-{}{}", kPrefix, ::getpid(), attempt, kSuffix), mode) || errno != EEXIST)
            return;
    }
}

UnfinishedFile::~UnfinishedFile() {
    remove();
}

bool UnfinishedFile::make(const std::string& name, mode_t mode) {
    const std::string path = folder_ + name;
    FileDescriptor file(::open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, mode));
    if (!file.isOpen()) return false;
    // Until it is locked, another process may take it for one that was left behind and remove it.
    const bool isTaken = ::flock(file.number(), LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK;
    struct stat status {};
    const bool isPrivate = ::fstat(file.number(), &status) == 0 &&
                           ((status.st_mode & 07777U) == 0600 || ::fchmod(file.number(), 0600) == 0);
    if (!isPrivate || isTaken || status.st_nlink == 0) {
        const int reason = isPrivate ? EEXIST : errno;
        ::unlink(path.c_str());
        errno = reason;
        return false;
    }
    modeAtCreation_ = status.st_mode & 07777U;
    file_ = std::move(file);
    path_ = path;
    setSlot(slot_, path_);
    return true;
}

bool UnfinishedFile::renameForExchangeWith(const FileStamp& old) {
    struct stat status {};
    if (::fstat(descriptor(), &status) != 0) return false;
    const std::string name = fmt::format(
        "{}-{:x}-{:x}{}", path_.substr(folder_.size(), path_.size() - folder_.size() - kSuffix.size()),
        markOf(FileStamp::of(status)), markOf(old), kSuffix);
    giveSlotBack();
    if (::rename(path_.c_str(), (folder_ + name).c_str()) != 0) return false;
    path_ = folder_ + name;
    return true;
}

void UnfinishedFile::remove() {
    if (!path_.empty() && owner_ == ::getpid()) ::unlink(path_.c_str());
    release();
}

void UnfinishedFile::release() {
    path_.clear();
    giveSlotBack();
}

void UnfinishedFile::giveSlotBack() {
    freeSlot(slot_);
    slot_ = slots.size();
}

void removeLeftFiles(const std::string& folder) {
    if (isLookedThrough(folder)) return;
    const std::unique_ptr<DIR, int (*)(DIR*)> entries(::opendir(folder.c_str()), ::closedir);
    if (!entries) return;
    while (const dirent* entry = ::readdir(entries.get()))
        removeIfLeft(::dirfd(entries.get()), entry->d_name);
}

void removeUnfinishedFilesWhenEnded() {
    struct sigaction removing {};
    removing.sa_handler = removeUnfinishedFilesAndEnd;
    removing.sa_flags = static_cast<int>(SA_RESETHAND);
    for (const int signal : kEndingSignals) {
        struct sigaction former {};
        const bool isIgnored = ::sigaction(signal, nullptr, &former) == 0 && former.sa_handler == SIG_IGN;
        if (!isIgnored) ::sigaction(signal, &removing, nullptr);
    }
}

EndingSignalsHeld::EndingSignalsHeld() {
    sigset_t ending;
    ::sigemptyset(&ending);
    for (const int signal : kEndingSignals) ::sigaddset(&ending, signal);
    ::pthread_sigmask(SIG_BLOCK, &ending, &former_);
}

EndingSignalsHeld::~EndingSignalsHeld() {
    const int reason = errno;
    ::pthread_sigmask(SIG_SETMASK, &former_, nullptr);
    errno = reason;
}

}  // namespace qvct
