#include "platform/files/EditLock.h"

#include "platform/files/FileDescriptor.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>
#include <vector>

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/file.h>
#include <sys/stat.h>

namespace qvct {
namespace {

using Key = std::tuple<std::uint64_t, std::uint64_t, int>;

/// A lock that this thread holds, and how often.
struct Held {
    Key key;
    FileDescriptor descriptor;
    int count = 1;
};

/// The locks that this thread holds, without those that a forked process inherited from its parent.
std::vector<Held>& heldByThisThread() {
    thread_local std::vector<Held> held;
    std::erase_if(held, [](const Held& each) { return std::get<int>(each.key) != ::getpid(); });
    return held;
}

auto heldOn(const Key& key) {
    auto& held = heldByThisThread();
    return std::find_if(held.begin(), held.end(), [&](const Held& each) { return each.key == key; });
}

std::string folderOf(const std::string& path) {
    std::error_code notThere;
    std::filesystem::path resolved = std::filesystem::canonical(path, notThere);
    if (notThere) resolved = path;
    const std::filesystem::path folder = resolved.parent_path();
    return folder.empty() ? "." : folder.string();
}

/// "process 12 (name)", or nothing where the system does not tell.
std::string holderOf(std::uint64_t inode) {
    std::ifstream locks("/proc/locks");
    const std::string suffix = fmt::format(":{}", inode);
    for (std::string line; std::getline(locks, line);) {
        std::istringstream fields(line);
        std::string number, kind, strictness, access, process, file;
        fields >> number >> kind >> strictness >> access >> process >> file;
        if (kind != "FLOCK" || !file.ends_with(suffix)) continue;
        std::string name;
        std::getline(std::ifstream("/proc/" + process + "/comm"), name);
        return fmt::format("process {}{}", process, name.empty() ? "" : " (" + printable(name) + ")");
    }
    return {};
}

/// Tries again and again, since a blocking wait with a time limit would need signals. Zero, or an error
/// number.
int lockWithin(int folder, std::chrono::milliseconds patience) {
    using Clock = std::chrono::steady_clock;
    constexpr std::chrono::milliseconds kLongestPause(10);
    const auto end = Clock::now() + patience;
    for (std::chrono::milliseconds pause(1);; pause = std::min(2 * pause, kLongestPause)) {
        if (::flock(folder, LOCK_EX | LOCK_NB) == 0) return 0;
        if (errno == EINTR) continue;
        if (errno != EWOULDBLOCK || Clock::now() >= end) return errno;
        std::this_thread::sleep_for(pause);
    }
}

}  // namespace

std::unique_ptr<EditLock> EditLock::acquire(const std::string& path, Error* error,
                                            std::chrono::milliseconds patience) {
    FileDescriptor descriptor(::open(folderOf(path).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    struct stat status {};
    if (!descriptor.isOpen() || ::fstat(descriptor.number(), &status) != 0)
        return std::unique_ptr<EditLock>(new EditLock({}));
    const Key key(status.st_dev, status.st_ino, ::getpid());
    const auto held = heldOn(key);
    if (held != heldByThisThread().end()) {
        ++held->count;
        return std::unique_ptr<EditLock>(new EditLock(key));
    }
    if (lockWithin(descriptor.number(), patience) == EWOULDBLOCK) {
        const std::string holder = holderOf(status.st_ino);
        fail(error, kErrorUnwritable,
             fmt::format("waited {} s for a turn to write in its folder, which {} has now",
                         std::chrono::duration<double>(patience).count(),
                         holder.empty() ? "another program" : holder),
             {path});
        return nullptr;
    }
    heldByThisThread().push_back({key, std::move(descriptor)});
    return std::unique_ptr<EditLock>(new EditLock(key));
}

EditLock::~EditLock() {
    const auto held = heldOn(key_);
    if (held == heldByThisThread().end() || --held->count > 0) return;
    // Closing would not do: a process that was forked meanwhile has the descriptor, too.
    ::flock(held->descriptor.number(), LOCK_UN);
    heldByThisThread().erase(held);
}

}  // namespace qvct
