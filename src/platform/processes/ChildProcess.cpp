#include "platform/processes/ChildProcess.h"

#include "platform/text/Text.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <optional>
#include <utility>

#include <fcntl.h>
#include <fmt/format.h>
#include <poll.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

namespace qvct {
namespace {

/// A copy of the descriptor whose number is none of the child's standard streams: a host may have closed its
/// own, so that new files get these numbers. Closes the one given.
FileDescriptor raised(int descriptor) {
    constexpr int kFirst = STDERR_FILENO + 1;
    const FileDescriptor given(descriptor);
    return FileDescriptor(::fcntl(given.number(), F_DUPFD_CLOEXEC, kFirst));
}

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

}  // namespace

std::unique_ptr<ChildProcess> ChildProcess::start(const std::string& program,
                                                  const std::vector<std::string>& arguments,
                                                  std::size_t memory, Error* error) {
    std::array<int, 2> pair = {-1, -1};
    auto shared = SharedMemory::make(memory);
    std::optional<pid_t> id;
    FileDescriptor ours(-1);
    if (shared && ::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, pair.data()) == 0) {
        ours = raised(pair[0]);
        const FileDescriptor theirs = raised(pair[1]);
        const FileDescriptor theirMemory(::fcntl(shared->descriptor(), F_DUPFD_CLOEXEC, STDERR_FILENO + 1));
        if (ours.isOpen() && theirs.isOpen() && theirMemory.isOpen())
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
    while (true) {
        const ssize_t count = ::recv(socket_.number(), chunk.data(), chunk.size(), 0);
        if (count < 0 && errno == EINTR) continue;
        if (count <= 0) return count < 0 && (errno == EAGAIN || errno == EWOULDBLOCK);
        bytes.append(chunk.data(), static_cast<std::size_t>(count));
    }
}

void ChildProcess::kill() {
    if (id_ != 0) ::kill(id_, SIGKILL);
}

ProcessEnd ChildProcess::end() {
    if (id_ == 0) return {};
    socket_ = FileDescriptor(-1);
    kill();
    int status = 0;
    while (::waitpid(id_, &status, 0) < 0 && errno == EINTR) {
    }
    id_ = 0;
    return {WEXITSTATUS(status), WIFSIGNALED(status) ? ::strsignal(WTERMSIG(status)) : ""};
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
