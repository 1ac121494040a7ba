#include "platform/files/EditLock.h"
#include "support/TemporaryFolder.h"

#include <chrono>
#include <csignal>
#include <thread>

#include <fmt/format.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace qvct {
namespace {

using std::chrono::milliseconds;
using test::TemporaryFolder;
using testing::HasSubstr;

/// Whether another thread gets its turn at `path` at once.
bool isFree(const std::string& path, Error* error = nullptr) {
    bool isFree = false;
    std::thread([&] { isFree = EditLock::acquire(path, error, milliseconds(0)) != nullptr; }).join();
    return isFree;
}

TEST(EditLock, IsOneForAFolderHoweverItIsReached) {
    const TemporaryFolder folder;
    const std::string item = folder.write("A/item", "x");
    folder.write("A/Bundle/tags.plist", "x");
    std::filesystem::create_symlink(item, folder.path("link"));
    const auto turn = EditLock::acquire(item);
    for (const char* name : {"A/item", "A/new", "A/Bundle", "A/../A/item", "link"})
        EXPECT_FALSE(isFree(folder.path(name))) << name;
    for (const char* name : {"A", "B", "A/Bundle/tags.plist", "missing/item"})
        EXPECT_TRUE(isFree(folder.path(name))) << name;
    const std::filesystem::directory_iterator files(folder.path("A"));
    EXPECT_EQ(std::distance(begin(files), end(files)), 2) << "it left a file behind";
}

TEST(EditLock, IsTakenAgainByItsThreadAndEndsWithTheLast) {
    const TemporaryFolder folder;
    const std::string item = folder.write("item", "x");
    auto outer = EditLock::acquire(item, nullptr, milliseconds(0));
    auto inner = EditLock::acquire(item, nullptr, milliseconds(0));
    ASSERT_TRUE(outer && inner);
    outer.reset();
    EXPECT_FALSE(isFree(item));
    inner.reset();
    EXPECT_TRUE(isFree(item));
}

/// A process forked from here that does this one thing, and ends with its status.
template <typename Work>
pid_t forked(const Work& work) {
    const pid_t child = ::fork();
    if (child == 0) ::_exit(work());
    return child;
}

TEST(EditLock, EndsAlthoughAProcessWasForkedMeanwhile) {
    const TemporaryFolder folder;
    const std::string item = folder.write("item", "x");
    auto turn = EditLock::acquire(item);
    const pid_t child = forked(::pause);
    EXPECT_FALSE(isFree(item));
    turn.reset();
    EXPECT_TRUE(isFree(item));
    ::kill(child, SIGKILL);
    ::waitpid(child, nullptr, 0);
}

TEST(EditLock, IsNeitherHeldNorEndedByAProcessThatWasForkedMeanwhile) {
    const TemporaryFolder folder;
    const std::string item = folder.write("item", "x");
    auto turn = EditLock::acquire(item);
    const pid_t child = forked([&] {
        const bool isHeld = EditLock::acquire(item, nullptr, milliseconds(0)) != nullptr;
        turn.reset();
        return isHeld ? 1 : 0;
    });
    int status = 0;
    ::waitpid(child, &status, 0);
    EXPECT_EQ(status, 0) << "it is held";
    EXPECT_FALSE(isFree(item)) << "it was ended";
}

TEST(EditLock, OfAnotherProcessIsWaitedForAndNamed) {
    const TemporaryFolder folder;
    const std::string item = folder.write("item", "x");
    const auto older = EditLock::acquire(folder.write("older/item", "x"));
    int held[2];
    ASSERT_EQ(::pipe(held), 0);
    const pid_t child = forked([&] {
        const auto turn = EditLock::acquire(item);
        [[maybe_unused]] const ssize_t told = ::write(held[1], "x", 1);
        return ::usleep(400'000);
    });
    char byte = 0;
    ASSERT_EQ(::read(held[0], &byte, 1), 1);
    const auto newer = EditLock::acquire(folder.write("newer/item", "x"));
    Error error;
    EXPECT_FALSE(EditLock::acquire(item, &error, milliseconds(20)));
    EXPECT_THAT(error.message(),
                testing::AllOf(HasSubstr(item), HasSubstr(fmt::format("process {} (", child)),
                               HasSubstr("waited 0.02 s")));
    EXPECT_TRUE(EditLock::acquire(item, &error)) << "it ends with the process";
    ::waitpid(child, nullptr, 0);
    ::close(held[0]);
    ::close(held[1]);
}

TEST(EditLock, LetsThroughWhereThereAreNoLocks) {
    const TemporaryFolder folder;
    const std::string item = folder.write("item", "x");
    ::chmod(folder.path().c_str(), 0311);
    const bool isRoot = ::geteuid() == 0;
    ASSERT_EQ(isRoot ? ::seteuid(65534) : 0, 0);
    const auto first = EditLock::acquire(item, nullptr, milliseconds(0));
    const bool isThrough = first && isFree(item);
    ASSERT_EQ(isRoot ? ::seteuid(0) : 0, 0);
    ::chmod(folder.path().c_str(), 0755);
    EXPECT_TRUE(isThrough);
}

}  // namespace
}  // namespace qvct
