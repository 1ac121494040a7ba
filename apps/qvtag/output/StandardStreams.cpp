#include "output/StandardStreams.h"

#include "platform/processes/StandardStreams.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

namespace qvct::tool {
namespace {

int lossOfOutput = 0;  // the first error number; 0 while nothing is lost

void keepLoss() {
    if (lossOfOutput == 0) lossOfOutput = errno != 0 ? errno : EIO;
}

}  // namespace

void prepareStandardStreams() {
    openStandardStreams();
    ignoreBrokenPipes();
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
    if (!closeStream(StandardStream::output)) keepLoss();
    if (lossOfOutput != 0 && lossOfOutput != EPIPE)
        printError("qvtag: standard output: {}\n", std::strerror(lossOfOutput));
    return lossOfOutput == 0;
}

}  // namespace qvct::tool
