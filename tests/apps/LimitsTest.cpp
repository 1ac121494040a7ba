// What one file may cost, whatever is in it: time and memory in proportion to its size.

#include "demo/Library.h"
#include "support/Places.h"
#include "support/TemporaryFolder.h"

#include <algorithm>
#include <filesystem>

#include <fcntl.h>
#include <fmt/format.h>
#include <gtest/gtest.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>

namespace qvct::test {
namespace {

namespace fs = std::filesystem;

constexpr double kSecondsToStart = 1;
constexpr double kSecondsPerMegabyte = 1;
constexpr double kMebibytes = 64;
constexpr double kMebibytesPerMebibyte = 4;

struct Cost {
    double seconds = 0;    // of processor time
    double mebibytes = 0;  // at most at a time
    bool hasEnded = false;
};

Cost costOf(std::vector<std::string> command) {
    std::vector<char*> arguments;
    for (std::string& argument : command) arguments.push_back(argument.data());
    arguments.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
        ::posix_spawn_file_actions_addopen(&actions, stream, "/dev/null", O_RDWR, 0);
    pid_t child = -1;
    ::posix_spawn(&child, command[0].c_str(), &actions, nullptr, arguments.data(), environ);
    ::posix_spawn_file_actions_destroy(&actions);
    int status = -1;
    rusage usage{};
    ::wait4(child, &status, 0, &usage);
    const auto seconds = [](const timeval& time) {
        return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) * 1e-6;
    };
    return {seconds(usage.ru_utime) + seconds(usage.ru_stime), static_cast<double>(usage.ru_maxrss) / 1024,
            WIFEXITED(status)};
}

/// Mebibytes of a file, or of all that a bundle holds.
double sizeOf(const fs::path& item) {
    if (fs::is_regular_file(item)) return static_cast<double>(fs::file_size(item)) / (1 << 20);
    double size = 0;
    for (const auto& entry : fs::recursive_directory_iterator(item)) {
        if (entry.is_regular_file()) size += static_cast<double>(entry.file_size()) / (1 << 20);
    }
    return size;
}

/// All files below a folder, those in bundles as well, and the bundles.
std::vector<fs::path> itemsBelow(const fs::path& folder) {
    std::vector<fs::path> items;
    for (const auto& entry : fs::recursive_directory_iterator(folder)) {
        if (entry.is_regular_file() || entry.path().has_extension()) items.push_back(entry.path());
    }
    return items;
}

std::size_t expectWithinLimits(const fs::path& folder) {
    // Between them they use every reader.
    const std::vector<std::vector<std::string>> commands = {{"inspect"}, {"autotag", "--rhythm-any"}};
    const std::vector<fs::path> items = itemsBelow(folder);
    for (const fs::path& item : items) {
        for (const auto& command : commands) {
            SCOPED_TRACE(fmt::format("{} {}", command.front(), item.string()));
            std::vector<std::string> line{QVCT_TOOL};
            line.insert(line.end(), command.begin(), command.end());
            line.push_back(item.string());
            const Cost cost = costOf(line);
            const double size = sizeOf(item);
            EXPECT_TRUE(cost.hasEnded);
            EXPECT_LE(cost.seconds, kSecondsToStart + kSecondsPerMegabyte * size);
            EXPECT_LE(cost.mebibytes, kMebibytes + kMebibytesPerMebibyte * size);
        }
    }
    return items.size();
}

TEST(Limits, HoldForContentOfEveryKind) {
    const TemporaryFolder folder;
    demo::writeLibrary(folder.path());
    EXPECT_GT(expectWithinLimits(folder.path()), 50U);
}

TEST(Limits, HoldForInputsThatFuzzingFound) {
    EXPECT_GT(expectWithinLimits(QVCT_FUZZ_SEEDS), 0U);
}

TEST(Limits, HoldForRealFilesBesideTheProject) {
    if (!fs::is_directory(QVCT_CORPUS)) GTEST_SKIP() << "no " << QVCT_CORPUS;
    EXPECT_GT(expectWithinLimits(QVCT_CORPUS), 0U);
}

}  // namespace
}  // namespace qvct::test
