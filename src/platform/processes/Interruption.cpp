#include "platform/processes/Interruption.h"

#include <csignal>

namespace qvct {
namespace {

volatile std::sig_atomic_t isInterrupted = 0;

}  // namespace

void interruptGently() {
    struct sigaction action {};
    action.sa_handler = [](int) { isInterrupted = 1; };
    action.sa_flags = static_cast<int>(SA_RESETHAND);
    ::sigaction(SIGINT, &action, nullptr);
}

bool wasInterrupted() {
    return isInterrupted != 0;
}

}  // namespace qvct
