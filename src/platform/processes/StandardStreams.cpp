#include "platform/processes/StandardStreams.h"

#include <csignal>

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace qvct {
namespace {

int numberOf(StandardStream stream) {
    return stream == StandardStream::output ? STDOUT_FILENO : STDERR_FILENO;
}

}  // namespace

void openStandardStreams() {
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        // Opened in the wrong direction, so that using it fails as on a closed stream. It gets the lowest
        // free number, which is this one.
        if (::fcntl(stream, F_GETFD) < 0)
            static_cast<void>(::open("/dev/null", stream == STDIN_FILENO ? O_WRONLY : O_RDONLY));
    }
}

FileDescriptor besideStandardStreams(FileDescriptor file) {
    if (!file.isOpen() || file.number() > STDERR_FILENO) return file;
    return FileDescriptor(::fcntl(file.number(), F_DUPFD_CLOEXEC, STDERR_FILENO + 1));
}

void ignoreBrokenPipes() {
    std::signal(SIGPIPE, SIG_IGN);
}

bool isTerminal(StandardStream stream) {
    return ::isatty(numberOf(stream)) != 0;
}

std::optional<std::size_t> columnsOf(StandardStream stream) {
    winsize size{};
    const bool isKnown = ::ioctl(numberOf(stream), TIOCGWINSZ, &size) == 0 && size.ws_col > 0;
    return isKnown ? std::optional<std::size_t>(size.ws_col) : std::nullopt;
}

bool closeStream(StandardStream stream) {
    return ::close(numberOf(stream)) == 0;
}

}  // namespace qvct
