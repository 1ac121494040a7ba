#include "platform/processes/ChildProcess.h"

#include "platform/processes/StandardStreams.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <mutex>
#include <utility>

#include <fcntl.h>
#include <fmt/format.h>
#include <poll.h>
#include <spawn.h>
#include <sys/socket.h>
#include <unistd.h>

namespace qvct {
namespace {

/// What a process gets to end by itself, and the system to end one that was killed.
constexpr std::chrono::milliseconds kGrace(1000);
constexpr std::size_t kMostAtOnce = 1U << 20U;

/// What the child gets: its files, and default signal handling, except that SIGINT is blocked: a terminal
/// sends it to all of its processes, and this one decides what it means.
class SpawnPlan {
  public:
    SpawnPlan(int input, int output) {
        ::posix_spawn_file_actions_init(&files_);
        ::posix_spawn_file_actions_adddup2(&files_, input, STDIN_FILENO);
        ::posix_spawn_file_actions_adddup2(&files_, output, STDOUT_FILENO);
        ::posix_spawn_file_actions_addclosefrom_np(&files_, STDERR_FILENO + 1);
        ::posix_spawnattr_init(&attributes_);
        sigset_t signals;
        ::sigfillset(&signals);
        ::posix_spawnattr_setsigdefault(&attributes_, &signals);
        ::sigemptyset(&signals);
        ::sigaddset(&signals, SIGINT);
        ::posix_spawnattr_setsigmask(&attributes_, &signals);
        ::posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETSIGMASK);
    }
    SpawnPlan(const SpawnPlan&) = delete;
    SpawnPlan& operator=(const SpawnPlan&) = delete;
    ~SpawnPlan() {
        ::posix_spawn_file_actions_destroy(&files_);
        ::posix_spawnattr_destroy(&attributes_);
    }

    /// The process's id; or nothing, and `errno` says why.
    std::optional<pid_t> start(std::string program, std::vector<std::string> arguments) const {
        std::vector<char*> words = {program.data()};
        for (std::string& argument : arguments) words.push_back(argument.data());
        words.push_back(nullptr);
        pid_t id = 0;
        errno = ::posix_spawn(&id, program.c_str(), &files_, &attributes_, words.data(), environ);
        return errno == 0 ? std::optional(id) : std::nullopt;
    }

  private:
    posix_spawn_file_actions_t files_{};
    posix_spawnattr_t attributes_{};
};

/// Processes that were killed and have not ended: they wait for a disk that does not answer, for example.
/// The system keeps each in its table until it has ended and was asked how.
class Abandoned {
  public:
    void add(ProcessHandle process) {
        const std::lock_guard lock(mutex_);
        processes_.push_back(std::move(process));
    }
    void ask() {
        const std::lock_guard lock(mutex_);
        std::erase_if(processes_, [](const ProcessHandle& process) {
            return process.awaitEnd(std::chrono::milliseconds(0)).has_value();
        });
    }

  private:
    std::mutex mutex_;
    std::vector<ProcessHandle> processes_;
};

Abandoned& abandoned() {
    static Abandoned all;
    return all;
}

}  // namespace

std::unique_ptr<ChildProcess> ChildProcess::start(const std::string& program,
                                                  const std::vector<std::string>& arguments,
                                                  std::size_t memory, Error* error) {
    if (!std::filesystem::path(program).is_absolute()) {
        fail(error, kErrorInvalidArgument, "is not an absolute path", {program});
        return nullptr;
    }
    abandoned().ask();
    std::array<int, 2> pair = {-1, -1};
    std::optional<pid_t> id;
    FileDescriptor ours(-1);
    const FileDescriptor theirMemory = besideStandardStreams(SharedMemory::make(memory));
    auto shared = SharedMemory::map(theirMemory, memory);
    if (shared && ::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, pair.data()) == 0) {
        ours = besideStandardStreams(FileDescriptor(pair[0]));
        const FileDescriptor theirs = besideStandardStreams(FileDescriptor(pair[1]));
        if (ours.isOpen() && theirs.isOpen())
            id = SpawnPlan(theirs.number(), theirMemory.number()).start(program, arguments);
    }
    if (!id) {
        fail(error, kErrorUnreadable, fmt::format("cannot be started: {}", std::strerror(errno)), {program});
        return nullptr;
    }
    ::fcntl(ours.number(), F_SETFL, O_NONBLOCK);
    return std::unique_ptr<ChildProcess>(new ChildProcess(*id, std::move(ours), *std::move(shared)));
}

ChildProcess::~ChildProcess() {
    end();
}

void ChildProcess::send(std::string& bytes) {
    std::size_t at = 0;
    while (at < bytes.size()) {
        const ssize_t sent = ::send(socket_.number(), bytes.data() + at, bytes.size() - at, MSG_NOSIGNAL);
        if (sent <= 0) break;  // full, or gone: then receiving tells
        at += static_cast<std::size_t>(sent);
    }
    bytes.erase(0, at);
}

bool ChildProcess::receive(std::string& bytes) {
    std::array<char, 1U << 16U> chunk;
    for (std::size_t taken = 0; taken < kMostAtOnce;) {
        const ssize_t count = ::recv(socket_.number(), chunk.data(), chunk.size(), 0);
        if (count < 0 && errno == EINTR) continue;
        if (count <= 0) return count < 0 && (errno == EAGAIN || errno == EWOULDBLOCK);
        bytes.append(chunk.data(), static_cast<std::size_t>(count));
        taken += static_cast<std::size_t>(count);
    }
    return true;
}

void ChildProcess::hangUp() {
    if (!socket_.isOpen()) return;
    socket_ = FileDescriptor(-1);
    hungUp_ = std::chrono::steady_clock::now();
}

void ChildProcess::kill() {
    if (process_) process_->kill();
}

ProcessEnd ChildProcess::end() {
    if (!process_) return {};
    hangUp();
    const auto since = std::chrono::steady_clock::now() - hungUp_;
    auto end = process_->awaitEnd(kGrace - std::chrono::duration_cast<std::chrono::milliseconds>(since));
    if (!end) {
        process_->kill();
        end = process_->awaitEnd(kGrace);
    }
    if (!end) abandoned().add(*std::move(process_));
    process_.reset();
    return end.value_or(ProcessEnd{});
}

void ChildProcess::await(std::span<const Awaited> processes, std::chrono::milliseconds patience) {
    std::vector<pollfd> sockets;
    for (const Awaited& awaited : processes) {
        const int events = awaited.hasToSend ? POLLIN | POLLOUT : POLLIN;
        sockets.push_back({awaited.process->socket_.number(), static_cast<short>(events), 0});
    }
    ::poll(sockets.data(), sockets.size(), static_cast<int>(patience.count()));
}

}  // namespace qvct
