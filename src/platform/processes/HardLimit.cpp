#include "platform/processes/HardLimit.h"

#include <array>
#include <atomic>
#include <cerrno>
#include <charconv>
#include <csignal>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <system_error>

#include <fcntl.h>
#include <sys/time.h>
#include <time.h>
#include <unistd.h>

namespace qvct {
namespace {

constexpr suseconds_t kMicrosecondsBetweenLooks = 10'000;
constexpr std::size_t kLongestMessage = 256;

bool isEnabled = false;
void (*beforeWork)() = nullptr;
int depth = 0;
// Read by the signal handler, which may call nothing that takes a lock.
std::atomic<std::int64_t> deadline{0};  // in nanoseconds; 0 when nothing is guarded
std::atomic<std::size_t> mostPages{0};
std::array<char, kLongestMessage> message{};

std::int64_t now() {
    timespec time{};
    ::clock_gettime(CLOCK_MONOTONIC, &time);
    return std::int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

/// Pages of memory that the process has; 0 when the system does not say.
std::size_t residentPages() {
    const int file = ::open("/proc/self/statm", O_RDONLY | O_CLOEXEC);
    if (file < 0) return 0;
    std::array<char, 128> text{};
    const ssize_t length = ::read(file, text.data(), text.size());
    ::close(file);
    const std::string_view line(text.data(), length > 0 ? static_cast<std::size_t>(length) : 0);
    const std::size_t blank = line.find(' ');  // the first number is the size of the address space
    std::size_t pages = 0;
    if (blank != std::string_view::npos)
        std::from_chars(line.data() + blank + 1, line.data() + line.size(), pages);
    return pages;
}

void look(int /*signal*/) {
    const int interrupted = errno;
    const std::int64_t end = deadline;
    if (end != 0 && (now() > end || residentPages() > mostPages)) {
        [[maybe_unused]] const ssize_t written =
            ::write(STDERR_FILENO, message.data(), std::strlen(message.data()));
        ::_exit(1);
    }
    errno = interrupted;
}

void setTimer(suseconds_t microseconds) {
    const itimerval interval{{0, microseconds}, {0, microseconds}};
    ::setitimer(ITIMER_REAL, &interval, nullptr);
}

}  // namespace

void HardLimit::enable(void (*prepare)()) {
    struct sigaction action {};
    action.sa_handler = look;
    action.sa_flags = SA_RESTART;
    ::sigemptyset(&action.sa_mask);
    beforeWork = prepare;
    isEnabled = ::sigaction(SIGALRM, &action, nullptr) == 0;
}

HardLimit::HardLimit(std::chrono::milliseconds time, std::size_t bytes, const std::string& work) {
    if (!isEnabled || depth++ > 0) return;
    if (beforeWork != nullptr) beforeWork();
    const std::string text = std::string(program_invocation_short_name) + ": " +
                             work.substr(0, kLongestMessage / 2) +
                             " takes too much and cannot be stopped; the process ends\n";
    const std::size_t length = text.copy(message.data(), message.size() - 1);
    message[length] = '\0';
    mostPages = residentPages() + bytes / static_cast<std::size_t>(::sysconf(_SC_PAGESIZE));
    deadline = now() + std::chrono::nanoseconds(time).count();
    setTimer(kMicrosecondsBetweenLooks);
}

HardLimit::~HardLimit() {
    if (!isEnabled || --depth > 0) return;
    deadline = 0;
    setTimer(0);
}

}  // namespace qvct
