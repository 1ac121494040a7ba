#include "output/StandardStreams.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>

#include <fcntl.h>
#include <unistd.h>

namespace qvct::tool {
namespace {

int lossOfOutput = 0;  // the first error number; 0 while nothing is lost

void keepLoss() {
    if (lossOfOutput == 0) lossOfOutput = errno != 0 ? errno : EIO;
}

}  // namespace

void prepareStandardStreams() {
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        // Against its direction, so that its use fails as on a closed one. It gets the lowest free number,
        // which is this one.
        if (::fcntl(stream, F_GETFD) < 0)
            static_cast<void>(::open("/dev/null", stream == STDIN_FILENO ? O_WRONLY : O_RDONLY));
    }
    std::signal(SIGPIPE, SIG_IGN);
}

void printText(std::string_view text) {
    errno = 0;
    if (lossOfOutput == 0 && std::fwrite(text.data(), 1, text.size(), stdout) != text.size()) keepLoss();
}

void flushOutput() {
    errno = 0;
    if (lossOfOutput == 0 && std::fflush(stdout) != 0) keepLoss();
}

void printErrorText(std::string_view text) {
    flushOutput();  // the two streams interleave as they were written
    static_cast<void>(std::fwrite(text.data(), 1, text.size(), stderr));
}

bool isOutputLost() {
    return lossOfOutput != 0;
}

bool finishOutput() {
    flushOutput();
    errno = 0;
    if (::close(STDOUT_FILENO) != 0) keepLoss();  // some file systems tell of a full disk only now
    if (lossOfOutput != 0 && lossOfOutput != EPIPE)
        printError("qvtag: standard output: {}\n", std::strerror(lossOfOutput));
    return lossOfOutput == 0;
}

}  // namespace qvct::tool
