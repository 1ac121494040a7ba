#include "platform/processes/ProcessArguments.h"

#include <algorithm>
#include <fstream>
#include <string>
#include <vector>

namespace qvct {
namespace {

/// A library is not given `main`'s arguments; the system tells them, each ended by a NUL.
std::vector<std::string> processArguments() {
    std::ifstream file("/proc/self/cmdline", std::ios::binary);
    std::vector<std::string> arguments;
    for (std::string argument; std::getline(file, argument, '\0');) arguments.push_back(argument);
    return arguments;
}

}  // namespace

bool processHasArgument(std::string_view argument) {
    static const std::vector<std::string> arguments = processArguments();
    return std::find(arguments.begin(), arguments.end(), argument) != arguments.end();
}

}  // namespace qvct
