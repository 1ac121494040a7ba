#include "demo/Library.h"

#include <cstdio>
#include <exception>
#include <string>

#include <fmt/format.h>

int main(int argc, char** argv) {
    const std::string argument = argc == 2 ? argv[1] : "";
    if (argument.empty() || argument.front() == '-') {
        std::FILE* stream = argument == "--help" ? stdout : stderr;
        fmt::print(stream,
                   "usage: qvtag-demo DIR\n\nWrites a small library of sounds and patches below DIR.\n"
                   "Example: qvtag-demo /tmp/demo && qvtag autotag /tmp/demo\n");
        return argument == "--help" ? 0 : 2;
    }
    try {
        fmt::print("{} items in {}\n", qvct::demo::writeLibrary(argument).size(), argument);
    } catch (const std::exception& error) {
        fmt::print(stderr, "qvtag-demo: {}\n", error.what());
        return 1;
    }
    return 0;
}
