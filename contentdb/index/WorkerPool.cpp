#include "contentdb/index/WorkerPool.h"

#include "contentdb/index/Worker.h"
#include "contentdb/terms/Terms.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <map>
#include <utility>

#include <fcntl.h>
#include <fmt/format.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

namespace qvct::contentdb {
namespace {

/// Items that one worker may have before it; enough that it never waits.
constexpr std::size_t kQueuePerWorker = 128;
/// Longest that a worker may take to make its describer: forked while another thread of the host had a lock
/// that this needs, it would wait for ever.
constexpr std::chrono::milliseconds kLongestStart{30000};
/// Workers in a row that may end without having described anything.
constexpr unsigned kMostBarrenWorkers = 5;

struct Waiting {
    std::string path;
    ItemStamp stamp;
};

struct Process {
    pid_t id = -1;
    int socket = -1;
    WorkerStatus* status = nullptr;
    std::string output;
    std::string input;
    std::map<std::uint64_t, Waiting> waiting;  // in the order of tickets, which is that of submission
    bool wasLate = false;
};

WorkerStatus* sharedStatus() {
    void* memory =
        ::mmap(nullptr, sizeof(WorkerStatus), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    return memory == MAP_FAILED ? nullptr : new (memory) WorkerStatus{};
}

}  // namespace

struct WorkerPool::Implementation {
    DescriberFactory factory;
    Settings settings;
    std::vector<Process> processes;
    unsigned barren = 0;

    bool start(Process& process) {
        int pair[2];
        if (process.status == nullptr) process.status = sharedStatus();
        if (process.status == nullptr) return false;
        process.status->ticket = 0;
        process.status->isStarting = true;
        process.status->since = monotonicNanoseconds();
        if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, pair) != 0) return false;
        const pid_t id = ::fork();
        if (id == 0) {
            ::close(pair[0]);
            // A worker that held another's socket would keep it waiting for ever.
            for (const Process& other : processes) {
                if (other.socket >= 0) ::close(other.socket);
            }
            runWorker(pair[1], *process.status, factory);
        }
        ::close(pair[1]);
        if (id < 0) {
            ::close(pair[0]);
            return false;
        }
        ::fcntl(pair[0], F_SETFL, O_NONBLOCK);
        process.id = id;
        process.socket = pair[0];
        process.wasLate = false;
        process.input.clear();
        process.output.clear();
        for (const auto& [ticket, task] : process.waiting)
            appendMessage(process.output, encodedTask(ticket, task.path, task.stamp));
        return true;
    }

    /// Ends the process and answers how it came to its end.
    std::string end(Process& process) {
        ::close(process.socket);
        process.socket = -1;
        int status = 0;
        ::kill(process.id, SIGKILL);  // it may be about to end by itself; then this does nothing
        while (::waitpid(process.id, &status, 0) < 0 && errno == EINTR) {
        }
        process.id = -1;
        if (process.wasLate) return fmt::format("reading it took longer than {} s", seconds());
        if (WIFSIGNALED(status)) return fmt::format("reading it crashed ({})", ::strsignal(WTERMSIG(status)));
        return fmt::format("reading it ended the process (status {})", WEXITSTATUS(status));
    }

    double seconds() const { return static_cast<double>(settings.timeLimit.count()) / 1000; }

    void send(Process& process) {
        while (!process.output.empty()) {
            const ssize_t sent =
                ::send(process.socket, process.output.data(), process.output.size(), MSG_NOSIGNAL);
            if (sent <= 0) return;  // full, or gone: then reading tells
            process.output.erase(0, static_cast<std::size_t>(sent));
        }
    }

    /// Whether the process is still there.
    bool receive(Process& process, const std::function<void(Described)>& take) {
        char chunk[1U << 16U];
        bool isThere = true;
        while (true) {
            const ssize_t count = ::recv(process.socket, chunk, sizeof chunk, 0);
            if (count < 0 && errno == EINTR) continue;
            isThere = count > 0 || (count < 0 && (errno == EAGAIN || errno == EWOULDBLOCK));
            if (count <= 0) break;
            process.input.append(chunk, static_cast<std::size_t>(count));
        }
        std::size_t at = 0;
        for (std::string_view message; nextMessage(process.input, at, message);) {
            Described described;
            if (!decodeAnswer(message, described) || process.waiting.erase(described.ticket) == 0)
                return false;
            barren = 0;
            take(std::move(described));
        }
        process.input.erase(0, at);
        return isThere;
    }

    /// Starts another process in the place of one that has ended; the item that it was at has failed.
    bool replace(Process& process, const std::function<void(Described)>& take) {
        const std::uint64_t culprit = process.status->ticket;
        const std::string reason = end(process);
        const auto hit = process.waiting.find(culprit);
        if (hit != process.waiting.end()) {
            Described failed;
            failed.ticket = culprit;
            failed.item.path = hit->second.path;
            failed.item.stamp = hit->second.stamp;
            failed.item.failure = reason;
            process.waiting.erase(hit);
            take(std::move(failed));
        } else if (++barren > kMostBarrenWorkers) {
            return false;
        }
        return start(process);
    }

    void endIfLate(Process& process) const {
        const std::uint64_t ticket = process.status->ticket;
        const bool isStarting = ticket == 0 && process.status->isStarting;
        if (ticket == 0 && !isStarting) return;
        const std::chrono::nanoseconds limit = isStarting ? kLongestStart : settings.timeLimit;
        if (monotonicNanoseconds() - process.status->since < limit.count()) return;
        if (process.status->ticket != ticket) return;  // it has gone on meanwhile
        process.wasLate = true;
        ::kill(process.id, SIGKILL);
    }
};

WorkerPool::WorkerPool(DescriberFactory factory, Settings settings)
    : implementation_(std::make_unique<Implementation>()) {
    implementation_->factory = std::move(factory);
    implementation_->settings = settings;
    implementation_->processes.resize(std::max(1U, settings.workers));
}

WorkerPool::~WorkerPool() {
    for (Process& process : implementation_->processes) {
        if (process.id > 0) implementation_->end(process);
        if (process.status != nullptr) ::munmap(process.status, sizeof(WorkerStatus));
    }
}

bool WorkerPool::hasRoom() const {
    return std::any_of(implementation_->processes.begin(), implementation_->processes.end(),
                       [](const Process& process) { return process.waiting.size() < kQueuePerWorker; });
}

void WorkerPool::submit(std::uint64_t ticket, std::string path, const ItemStamp& stamp) {
    auto& processes = implementation_->processes;
    Process& process = *std::min_element(
        processes.begin(), processes.end(),
        [](const Process& a, const Process& b) { return a.waiting.size() < b.waiting.size(); });
    appendMessage(process.output, encodedTask(ticket, path, stamp));
    process.waiting.emplace(ticket, Waiting{std::move(path), stamp});
}

bool WorkerPool::isBusy() const {
    return std::any_of(implementation_->processes.begin(), implementation_->processes.end(),
                       [](const Process& process) { return !process.waiting.empty(); });
}

bool WorkerPool::collect(const std::function<void(Described)>& take) {
    constexpr int patience = 100;  // milliseconds until the time limits are looked at again
    std::vector<pollfd> sockets;
    for (Process& process : implementation_->processes) {
        // A process is made when there is work for it: a run that finds nothing new makes none.
        if (process.id < 0 && !process.waiting.empty() && !implementation_->start(process)) return false;
        if (process.id < 0) continue;
        implementation_->send(process);
        const int events = process.output.empty() ? POLLIN : POLLIN | POLLOUT;
        sockets.push_back({process.socket, static_cast<short>(events), 0});
    }
    ::poll(sockets.data(), sockets.size(), patience);
    for (Process& process : implementation_->processes) {
        if (process.id < 0) continue;
        implementation_->endIfLate(process);
        if (!implementation_->receive(process, take) && !implementation_->replace(process, take))
            return false;
    }
    return true;
}

}  // namespace qvct::contentdb
