// What one file may cost, whatever is in it: time and memory in proportion to its size.

#include "demo/Library.h"
#include "support/AudioFixtures.h"
#include "support/Places.h"
#include "support/TemporaryFolder.h"
#include "support/Texts.h"

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

using Commands = std::vector<std::vector<std::string>>;
/// Between them they use every reader.
const Commands kReaders = {{"inspect"}, {"autotag", "--rhythm-any"}};

std::size_t expectWithinLimits(const fs::path& folder, const Commands& commands = kReaders) {
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

/// Patches whose descriptions and records make libraries compare everything with everything, or multiply.
void writeHostilePatches(const TemporaryFolder& folder) {
    const auto description = [&](const std::string& name, const std::string& xml) {
        folder.write(name + ".patch/org.qvcontenttagging.intermediate.cache.xml", xml);
    };
    const auto record = [&](const std::string& name, const std::string& xml) {
        folder.write(name + ".patch/tags.plist", "<plist version=\"1.0\"><dict>" + xml + "</dict></plist>");
    };
    std::string nested;
    for (int depth = 0; depth < 100; ++depth)
        nested += "<b" + repeated(900, " xmlns:n" + std::to_string(depth) + "x#='u'") + ">";
    description("attributes", "<P" + repeated(40000, " a#=''") + "/>");
    description("name-spaces", "<P" + repeated(100000, " xmlns:a#='u'") + "/>");
    description("name-spaces-in-scope", nested + repeated(50000, "<n0x0:c/>"));
    description("attributes-in-entity",
                "<!DOCTYPE P [<!ENTITY e \"&#60;b" + repeated(40000, " a#=''") + "/>\">]><P>&e;</P>");
    description("elements", "<P>" + repeated(1000000, "<a/>") + "</P>");
    record("values", "<key>KeyValueData</key><array>" + repeated(700000, "<dict/>") + "</array>");
    record("entries", "<key>KeyValueData</key><array>" + repeated(160000, "<true/>") + "</array>");
    record("keys", repeated(80000, "<key>k#</key><true/>"));
    record("key-values", "<key>KeyValueData</key><dict>" +
                             repeated(50000, "<key>k#</key><integer>1</integer>") + "</dict>");
}

TEST(Limits, HoldForHostilePatches) {
    const TemporaryFolder folder;
    writeHostilePatches(folder);
    Commands commands = kReaders;
    commands.push_back({"--json", "inspect"});
    commands.push_back({"--json", "read"});
    commands.push_back({"--json", "object"});
    EXPECT_GT(expectWithinLimits(folder.path(), commands), 5U);
}

TEST(Limits, HoldForContentOfEveryKind) {
    const TemporaryFolder folder;
    demo::writeLibrary(folder.path());
    EXPECT_GT(expectWithinLimits(folder.path()), 50U);
}

TEST(Limits, MemoryDoesNotGrowWithTheNumberOfItems) {
    const TemporaryFolder few;
    const TemporaryFolder many;
    const std::string sound = Wav().file(Wav().format() + Wav().data(0));
    const auto fill = [&sound](const TemporaryFolder& folder, int items) {
        for (int i = 0; i < items; ++i) folder.write(fmt::format("{}/Kick {}.wav", i / 100, i), sound);
    };
    fill(few, 100);
    fill(many, 4000);
    for (const char* form : {"--json", "--jsonl"}) {
        const auto memory = [form](const TemporaryFolder& folder) {
            return costOf({QVCT_TOOL, "autotag", form, folder.path()}).mebibytes;
        };
        EXPECT_LT(memory(many), memory(few) + 4) << form;
    }
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
