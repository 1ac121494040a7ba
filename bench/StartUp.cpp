// What a user of the tool waits for before anything appears: the start of the program, beside an empty one,
// and the first line over a large folder.
//
//   bench_start_up QVTAG
#include "Measure.h"
#include "support/AudioFixtures.h"
#include "support/TemporaryFolder.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <limits>
#include <string>
#include <vector>

#include <fcntl.h>
#include <fmt/format.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using namespace qvct;

struct Run {
    double processorSeconds = 0;
    double secondsToFirstByte = 0;
    double mebibytes = 0;  ///< at most at a time
};

/// Runs a program and reads what it prints to the end.
Run runOf(std::vector<std::string> command) {
    std::vector<char*> arguments;
    for (std::string& argument : command) arguments.push_back(argument.data());
    arguments.push_back(nullptr);
    std::array<int, 2> pipe{};
    if (::pipe2(pipe.data(), O_CLOEXEC) != 0) std::abort();
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_adddup2(&actions, pipe[1], STDOUT_FILENO);
    const double start = bench::clockTime();
    pid_t child = -1;
    if (::posix_spawn(&child, command[0].c_str(), &actions, nullptr, arguments.data(), environ) != 0)
        std::abort();
    ::posix_spawn_file_actions_destroy(&actions);
    ::close(pipe[1]);
    Run run;
    std::array<char, 1 << 16> bytes{};
    while (::read(pipe[0], bytes.data(), bytes.size()) > 0) {
        if (run.secondsToFirstByte == 0) run.secondsToFirstByte = bench::clockTime() - start;
    }
    ::close(pipe[0]);
    int status = 0;
    rusage usage{};
    ::wait4(child, &status, 0, &usage);
    for (const timeval& time : {usage.ru_utime, usage.ru_stime})
        run.processorSeconds += static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) * 1e-6;
    run.mebibytes = static_cast<double>(usage.ru_maxrss) / 1024;
    return run;
}

double leastProcessorTime(const std::vector<std::string>& command) {
    constexpr int kRepetitions = 60;
    double least = std::numeric_limits<double>::max();
    for (int i = 0; i < kRepetitions; ++i) least = std::min(least, runOf(command).processorSeconds);
    return least;
}

void benchStart(const std::string& tool) {
    const auto print = [](std::string_view what, double seconds, std::string_view target) {
        bench::printRow(what, fmt::format("{:.1f} ms", seconds * 1e3), target);
    };
    print("processor time of qvtag --version, least of 60", leastProcessorTime({tool, "--version"}),
          "at most 4 ms");
    print("  keywords TEXT", leastProcessorTime({tool, "keywords", "Warm Pad 120bpm"}), "at most 8 ms");
    print("  an empty program", leastProcessorTime({"/bin/true"}), "");
}

void benchFirstLine(const std::string& tool, int files) {
    const test::TemporaryFolder folder;
    const test::Wav wav;
    const std::string sound = wav.file(wav.format() + wav.data());
    for (int i = 0; i < files; ++i) folder.write(fmt::format("{}/Kick {}.wav", i / 100, i), sound);
    const Run run = runOf({tool, "autotag", "--jsonl", folder.path()});
    bench::printRow(fmt::format("first line of autotag --jsonl over {} files", files),
                    fmt::format("{:.0f} ms, {:.0f} MiB", run.secondsToFirstByte * 1e3, run.mebibytes),
                    "at most 50 ms");
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        fmt::print(stderr, "usage: bench_start_up QVTAG\n");
        return 2;
    }
    benchStart(argv[1]);
    for (const int files : {500, 5'000, 50'000}) benchFirstLine(argv[1], files);
    return 0;
}
