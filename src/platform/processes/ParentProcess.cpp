#include "platform/processes/ParentProcess.h"

#include "platform/processes/StandardStreams.h"

#include <array>
#include <cerrno>
#include <csignal>

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <unistd.h>

namespace qvct {
namespace {

/// Takes the file from a standard stream, which is closed by that.
FileDescriptor taken(int stream) {
    return besideStandardStreams(FileDescriptor(stream));
}

/// Whether nobody has the other end any more.
bool isHungUp(const FileDescriptor& socket) {
    pollfd end{socket.number(), 0, 0};
    return ::poll(&end, 1, 0) > 0 && (end.revents & POLLHUP) != 0;
}

}  // namespace

std::optional<ParentProcess> ParentProcess::connect(std::size_t memory) {
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    FileDescriptor socket = taken(STDIN_FILENO);
    auto shared = SharedMemory::map(taken(STDOUT_FILENO), memory);
    openStandardStreams();
    // A parent that was gone before it could be watched has closed its end already.
    if (!socket.isOpen() || !shared || isHungUp(socket)) return std::nullopt;
    return ParentProcess(std::move(socket), *std::move(shared));
}

bool ParentProcess::send(std::string& bytes) {
    for (std::size_t at = 0; at < bytes.size();) {
        const ssize_t sent = ::send(socket_.number(), bytes.data() + at, bytes.size() - at, MSG_NOSIGNAL);
        if (sent < 0 && errno == EINTR) continue;
        if (sent <= 0) return false;
        at += static_cast<std::size_t>(sent);
    }
    bytes.clear();
    return true;
}

bool ParentProcess::receive(std::string& bytes) {
    std::array<char, 1U << 16U> chunk;
    while (true) {
        const ssize_t count = ::recv(socket_.number(), chunk.data(), chunk.size(), 0);
        if (count < 0 && errno == EINTR) continue;
        if (count > 0) bytes.append(chunk.data(), static_cast<std::size_t>(count));
        return count > 0;
    }
}

bool ParentProcess::hasInput() const {
    pollfd waiting{socket_.number(), POLLIN, 0};
    return ::poll(&waiting, 1, 0) > 0;
}

}  // namespace qvct
