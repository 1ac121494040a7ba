#include "platform/processes/ProcessHandle.h"

#include "platform/processes/StandardStreams.h"

#include <cerrno>
#include <csignal>
#include <cstring>
#include <thread>

#include <fcntl.h>
#include <sys/wait.h>
// glibc 2.36 declares these for C alone.
extern "C" {
#include <sys/pidfd.h>
}

namespace qvct {
namespace {

ProcessEnd endOf(const siginfo_t& info) {
    if (info.si_code == CLD_EXITED) return {true, info.si_status, ""};
    return {true, 0, ::strsignal(info.si_status)};
}

}  // namespace

ProcessHandle::ProcessHandle(int id)
    : id_(id), descriptor_(besideStandardStreams(FileDescriptor(::pidfd_open(id, 0)))) {}

void ProcessHandle::kill() const {
    siginfo_t info{};
    if (descriptor_.isOpen()) {
        ::pidfd_send_signal(descriptor_.number(), SIGKILL, nullptr, 0);
    } else if (::waitid(P_PID, static_cast<id_t>(id_), &info, WEXITED | WNOHANG | WNOWAIT) == 0) {
        ::kill(id_, SIGKILL);
    }
}

std::optional<ProcessEnd> ProcessHandle::awaitEnd(std::chrono::milliseconds patience) const {
    constexpr std::chrono::milliseconds pause(1);
    const bool isHeld = descriptor_.isOpen();
    const auto until = std::chrono::steady_clock::now() + patience;
    while (true) {
        siginfo_t info{};
        const auto which = static_cast<id_t>(isHeld ? descriptor_.number() : id_);
        if (::waitid(isHeld ? P_PIDFD : P_PID, which, &info, WEXITED | WNOHANG) != 0 && errno == ECHILD)
            return ProcessEnd{};
        if (info.si_pid != 0) return endOf(info);
        if (std::chrono::steady_clock::now() >= until) return std::nullopt;
        std::this_thread::sleep_for(pause);
    }
}

}  // namespace qvct
